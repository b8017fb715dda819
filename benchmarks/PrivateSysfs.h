// SPDX-License-Identifier: Apache-2.0
#pragma once

/**
 * Mounts a file system in memory over /sys/class, only for this process and its children, so that
 * nodes can be plain files at their own paths. Must be called before there is a second thread.
 *
 * @return whether it succeeded, which needs root or user namespaces.
 */
bool enterPrivateSysfs();
