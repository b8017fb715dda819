// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/stat.h>
#include <utils/UniqueFd.h>

#include <string>
#include <string_view>
#include <vector>

namespace simulator {

using android::UniqueFd;

/**
 * An open folder. Its operations never leave it: names have no slashes, and symbolic links are not
 * followed.
 */
class Folder {
  public:
    /** Opens a folder by its path, "" for the root. Follows links: the user has named it. */
    Folder(const std::string& path);
    /** The same; makes the folder, and those above it, where there is none. */
    static Folder make(const std::string& path);
    /** Opens the folder at a relative path below another. @param create whether to make it. */
    Folder(const Folder& above, std::string_view path, bool create = false);

    /** @return the errno of opening it; 0 when it is open. */
    int error() const { return mError; }
    /** @return a file's type and mode; 0 when there is no such file. */
    mode_t mode(const std::string& name) const;
    /** Opens a plain file. @return none, and errno, if that fails. */
    UniqueFd open(const std::string& name, int flags, mode_t mode = 0) const;
    /** @return what a plain file holds; "" when there is none. */
    std::string read(const std::string& name) const;
    /** Replaces a file, of any type, in one step. @return an errno, 0 for success. */
    int replace(const std::string& name, std::string_view text, mode_t mode) const;
    /** Removes a file, or a link itself. */
    void remove(const std::string& name) const;
    /** @return the names of its entries, sorted. */
    std::vector<std::string> names() const;

  private:
    /** Goes to a folder, from another one. */
    void enter(int above, const char* name, int flags = 0);

    UniqueFd mFolder;
    int mError = 0;
};

}  // namespace simulator
