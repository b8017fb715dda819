// SPDX-License-Identifier: Apache-2.0
#pragma once

// Generated interface code includes this header, and uses nothing of it.
