// SPDX-License-Identifier: Apache-2.0
#include "Places.h"

#include <filesystem>
#include <system_error>
#include <utility>

#include "store/Directory.h"
#include "wire/Paths.h"

namespace Kestrel {
namespace {

namespace fs = std::filesystem;

constexpr mode_t publicMode = 0755;
constexpr mode_t privateMode = 0700;

/// The component of `path` that follows `base`, if `path` is below it.
std::optional<std::string> componentBelow(fs::path const &path, fs::path const &base) {
    auto rest = path.begin();
    for (fs::path const &part : base) {
        if (part.empty()) {
            continue; // a trailing slash
        }
        if (rest == path.end() || *rest != part) {
            return std::nullopt;
        }
        ++rest;
    }
    if (rest == path.end() || rest->empty()) {
        return std::nullopt;
    }
    return rest->string();
}

} // namespace

Places::Places(std::string root)
    : path_(std::move(root)) {}

Directory const &Places::root() {
    if (!root_.descriptor) {
        Store::makeDirectoryDurably(path_.empty() ? "/" : path_);
        root_ = openRoot(path_);
    }
    return root_;
}

Directory const &Places::volumes() {
    if (!volumes_.descriptor) {
        volumes_ = openOrMakeIn(root(), "volumes", publicMode);
    }
    return volumes_;
}

Directory const &Places::lumos() {
    if (!lumos_.descriptor) {
        lumos_ = openOrMakeIn(root(), "lumos", privateMode);
    }
    return lumos_;
}

Directory Places::container(std::string const &name) {
    return openOrMakeIn(volumes(), name, publicMode);
}

std::optional<std::string> Places::containerOf(std::string const &path) const {
    if (path.empty() || path.find('\0') != std::string::npos) {
        return std::nullopt;
    }
    std::error_code failed;
    fs::path const volumes = Wire::Paths(path_).volumes();
    fs::path const absolute = fs::absolute(path, failed);
    fs::path const base = fs::absolute(volumes, failed);
    if (failed) {
        return std::nullopt;
    }
    if (auto name = componentBelow(absolute.lexically_normal(), base.lexically_normal())) {
        return name;
    }
    // The same place by another road: the root, or the way to the working directory, leads through a link.
    fs::path const realPath = fs::weakly_canonical(absolute, failed);
    if (failed) {
        return std::nullopt;
    }
    fs::path const realBase = fs::weakly_canonical(base, failed);
    return failed ? std::nullopt : componentBelow(realPath, realBase);
}

} // namespace Kestrel
