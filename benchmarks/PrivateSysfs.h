// SPDX-License-Identifier: Apache-2.0
#pragma once

/**
 * Puts a file system in memory over /sys/class, for this process and its children alone, so that
 * the nodes are files of their own paths. Must come before the process has a second thread.
 *
 * @return whether it could be done: by root, or where users may make namespaces.
 */
bool enterPrivateSysfs();
