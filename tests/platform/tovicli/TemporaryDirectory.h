// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>

/// A directory of a test's own; removed at the end with all that it holds.
class TemporaryDirectory {
public:
    TemporaryDirectory();
    ~TemporaryDirectory();
    TemporaryDirectory(TemporaryDirectory const &) = delete;
    TemporaryDirectory &operator=(TemporaryDirectory const &) = delete;

    std::string const &path() const {
        return path_;
    }
    std::string operator/(std::string const &name) const {
        return path_ + "/" + name;
    }
    /// Copies a test plug-in in, under a name of its own.
    /// @param bytes how much of it; all when 0
    void addPlugin(std::string const &plugin, std::string const &as, std::size_t bytes = 0) const;

private:
    std::string path_;
};

std::string readFile(std::string const &path);
void writeFile(std::string const &path, std::string const &content);
