// SPDX-License-Identifier: Apache-2.0
#include "plugins/Directory.h"

#include <algorithm>
#include <cerrno>
#include <dirent.h>
#include <dlfcn.h>
#include <filesystem>
#include <memory>

namespace Tovicli::Cli {

std::vector<std::string> pluginFiles(std::string const &directory) {
    std::vector<std::string> files;
    auto const closeStream = [](DIR *stream) { closedir(stream); };
    std::unique_ptr<DIR, decltype(closeStream)> const stream(opendir(directory.c_str()), closeStream);
    while (dirent const *entry = stream != nullptr ? readdir(stream.get()) : nullptr) {
        std::string const name = entry->d_name;
        if (name.size() > 3 && name.ends_with(".so")) {
            files.push_back(directory + "/" + name);
        }
    }
    std::sort(files.begin(), files.end());
    return files;
}

std::vector<std::string> loadedBefore(std::string const &file, std::string const &directory) {
    std::error_code ignored;
    std::vector<std::string> before;
    for (std::string const &other : pluginFiles(directory)) {
        if (std::filesystem::equivalent(other, file, ignored)) {
            break;
        }
        before.push_back(other);
    }
    return before;
}

std::string installedLibraries() {
    Dl_info library{};
    if (dladdr(reinterpret_cast<void *>(&installedLibraries), &library) == 0 || library.dli_fname == nullptr) {
        return ".";
    }
    return std::filesystem::path(library.dli_fname).parent_path().parent_path().string();
}

} // namespace Tovicli::Cli
