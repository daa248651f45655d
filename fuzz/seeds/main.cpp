// SPDX-License-Identifier: Apache-2.0
//
// seeds DIRECTORY: makes DIRECTORY/TARGET/NAME for each target whose inputs the product itself can write.
#include <cstdio>
#include <exception>
#include <filesystem>

#include "Scratch.h"
#include "Seeds.h"

namespace {

/// Puts inputs into the folder of a target, in the place of those that were there.
Fuzz::Keep keeping(std::filesystem::path const &root, std::string_view target) {
    std::filesystem::path const folder = root / target;
    std::filesystem::remove_all(folder);
    std::filesystem::create_directories(folder);
    return
        [folder](std::string_view name, std::string_view bytes) { Fuzz::writeFile((folder / name).string(), bytes); };
}

void make(std::filesystem::path const &root) {
    Fuzz::makeDatabaseSeeds(keeping(root, "array_files"), keeping(root, "host_stores"));
    Fuzz::makeMessageSeeds(keeping(root, "compact_messages"));
    Fuzz::makeProviderAnswerSeeds(keeping(root, "provider_answers"));
    Fuzz::makeProviderRequestSeeds(keeping(root, "provider_requests"));
    Fuzz::makeReplySeeds(keeping(root, "replies"));
    Fuzz::makeRequestSeeds(keeping(root, "requests"));
}

} // namespace

int main(int count, char const *const *arguments) {
    if (count != 2) {
        std::fputs("usage: seeds DIRECTORY\n", stderr);
        return 2;
    }
    try {
        make(arguments[1]);
    } catch (std::exception const &failure) {
        std::fprintf(stderr, "seeds: %s\n", failure.what());
        return 1;
    }
    return 0;
}
