// SPDX-License-Identifier: Apache-2.0
//
// seeds DIRECTORY: makes DIRECTORY/TARGET/NAME for each target whose inputs the product itself can write.
#include <cstdio>
#include <exception>
#include <filesystem>

#include "Scratch.h"
#include "Seeds.h"

namespace {

struct Maker {
    char const *target;
    void (*make)(Fuzz::Keep const &keep);
};

constexpr Maker makers[] = {
    {"compact_messages", Fuzz::makeMessageSeeds},
    {"provider_answers", Fuzz::makeProviderAnswerSeeds},
    {"replies", Fuzz::makeReplySeeds},
};

} // namespace

int main(int count, char const *const *arguments) {
    if (count != 2) {
        std::fputs("usage: seeds DIRECTORY\n", stderr);
        return 2;
    }
    try {
        for (Maker const &maker : makers) {
            std::filesystem::path const folder = std::filesystem::path(arguments[1]) / maker.target;
            std::filesystem::remove_all(folder);
            std::filesystem::create_directories(folder);
            maker.make([&](std::string_view name, std::string_view bytes) {
                Fuzz::writeFile((folder / name).string(), bytes);
            });
        }
    } catch (std::exception const &failure) {
        std::fprintf(stderr, "seeds: %s\n", failure.what());
        return 1;
    }
    return 0;
}
