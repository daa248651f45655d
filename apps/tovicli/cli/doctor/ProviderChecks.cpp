// SPDX-License-Identifier: Apache-2.0
#include "doctor/ProviderChecks.h"

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <string_view>
#include <sys/stat.h>
#include <unistd.h>

#include <boost/algorithm/string/predicate.hpp>

#include "wire/UniqueFd.h"

namespace Tovicli::Cli {

namespace {

constexpr std::string_view fileScheme = "file://";
constexpr std::string_view databaseBegin = "SQLite format 3";
constexpr std::size_t headerBytes = 100;
constexpr std::size_t applicationIdAt = 68;
/// Stands in the header of every array file.
constexpr std::string_view arrayFileId = "TvAr";

/// "%2f" and the like; a "%" that begins nothing of the kind stands for itself.
std::string percentDecoded(std::string_view text) {
    constexpr std::string_view digits = "0123456789abcdef";
    auto const digit = [&digits](char c) {
        return digits.find(static_cast<char>(c >= 'A' && c <= 'F' ? c | 0x20 : c));
    };
    std::string decoded;
    for (std::size_t i = 0; i < text.size(); ++i) {
        std::size_t const high = text[i] == '%' && i + 2 < text.size() ? digit(text[i + 1]) : std::string_view::npos;
        std::size_t const low = high != std::string_view::npos ? digit(text[i + 2]) : std::string_view::npos;
        if (low != std::string_view::npos) {
            decoded += static_cast<char>(high * 16 + low);
            i += 2;
        } else {
            decoded += text[i];
        }
    }
    return decoded;
}

/// The path of file:///path or file://localhost/path; nothing for another URL.
std::optional<std::string> filePath(std::string const &url) {
    if (!boost::algorithm::istarts_with(url, fileScheme)) {
        return std::nullopt;
    }
    std::string_view rest = std::string_view(url).substr(fileScheme.size());
    constexpr std::string_view host = "localhost";
    if (boost::algorithm::istarts_with(rest, std::string(host) + "/")) {
        rest.remove_prefix(host.size());
    }
    return percentDecoded(rest);
}

/// Looks at a file's first bytes only: whoever opens a database may change it. @return what is wrong, or nothing
std::string arrayFileProblem(std::string const &path) {
    if (path.empty() || path[0] != '/') {
        return "an array file is named by its whole path, as in file:///path/name.array";
    }
    Wire::UniqueFd const file(open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    if (!file) {
        return "the array file '" + path + "' cannot be opened: " + std::strerror(errno);
    }
    struct stat status {};
    if (fstat(file.get(), &status) != 0 || !S_ISREG(status.st_mode)) {
        return "'" + path + "' is no regular file";
    }
    char header[headerBytes] = {};
    ssize_t const got = read(file.get(), header, sizeof(header));
    std::string_view const bytes(header, got > 0 ? static_cast<std::size_t>(got) : 0);
    if (bytes.size() < headerBytes || !bytes.starts_with(databaseBegin)) {
        return "'" + path + "' is no array file, or is damaged: it does not begin as one does";
    }
    if (bytes.substr(applicationIdAt, arrayFileId.size()) != arrayFileId) {
        return "'" + path + "' is a database of another program";
    }
    return {};
}

std::string listed(std::set<std::string> const &names) {
    std::string text;
    for (std::string const &name : names) {
        text += (text.empty() ? "" : ", ") + name;
    }
    return text;
}

template <typename Map>
std::size_t countOf(Map const &map, std::string const &key) {
    auto const found = map.find(key);
    return found != map.end() ? found->second.size() : 0;
}

void checkProvider(Store::Provider const &provider, std::optional<Served> const &served, Report &report) {
    std::string const name = "provider " + provider.name;
    std::optional<std::string> const path = filePath(provider.url);
    std::string const problem = path ? arrayFileProblem(*path) : std::string();
    if (!problem.empty()) {
        report.fail(name, problem);
    } else if (!served) {
        path ? report.ok(name, "'" + *path + "' is there; nobody could be asked whether it is served")
             : report.warn(name, provider.url + ": nobody could be asked whether it is reached");
    } else if (std::size_t const count = countOf(served->containersByUrl, provider.url); count > 0) {
        report.ok(name, provider.url + " serves " + std::to_string(count) +
                            (count == 1 ? " container" : " containers") + " of " +
                            listed(served->arraysByUrl.at(provider.url)));
    } else {
        report.warn(name, provider.url +
                              " serves no container: it cannot be reached, exports none, or another provider "
                              "is active for its arrays");
    }
}

} // namespace

void checkProviders(StoreView const &view, std::optional<Served> const &served, Report &report) {
    for (Store::Provider const &provider : view.providers) {
        checkProvider(provider, served, report);
    }
    for (Store::FileSystem const &fileSystem : view.fileSystems) {
        if (served && !served->containers.contains(fileSystem.containerId)) {
            report.warn("container " + fileSystem.name,
                        "it is mounted, and no provider exports it now (" + fileSystem.containerId + ")");
        }
    }
    for (std::string const &uid : view.outages) {
        report.warn("endpoint " + uid, "all its paths are said to be down");
    }
}

} // namespace Tovicli::Cli
