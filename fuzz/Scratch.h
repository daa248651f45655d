// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace Fuzz {

/// A directory in memory that goes with the object, for what code opens by path: a sync costs nothing there.
class ScratchDirectory {
public:
    ScratchDirectory();
    ~ScratchDirectory();
    ScratchDirectory(ScratchDirectory const &) = delete;
    ScratchDirectory &operator=(ScratchDirectory const &) = delete;

    std::string const &path() const {
        return path_;
    }
    std::string at(std::string_view name) const {
        return path_ + "/" + std::string(name);
    }

private:
    std::string path_;
};

/// Puts a file there, in the place of what was there.
void writeFile(std::string const &path, std::string_view bytes);
std::string readFile(std::string const &path);
/// Removes a file; one that is not there is none the worse.
void removeFile(std::string const &path);

} // namespace Fuzz
