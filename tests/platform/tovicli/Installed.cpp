// SPDX-License-Identifier: Apache-2.0
//
// The tool in an installation of its own: where it finds plug-ins and libraries, and whose library wins.
#include <cstdlib>
#include <filesystem>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "ProcessRun.h"

namespace {

using ::testing::StartsWith;

class Installed : public ::testing::Test {
protected:
    Installed() {
        std::filesystem::create_directories(place / "lib/tovicli/plugins");
        std::filesystem::create_directories(place / "bin");
        std::filesystem::copy(TEST_TOVICLI, place / "bin/tovicli");
        std::filesystem::copy(TEST_LIBPLEXA, place / "lib/libplexa.so.1");
        place.addPlugin("uses_client", "lib/tovicli/plugins/uses_client.so");
    }

    int ask(std::function<void()> const &arrange = [] {}) {
        return process.run(place / "bin/tovicli", {"storage", "ask"}, arrange);
    }

    TemporaryDirectory place;
    ProcessRun process;
};

TEST_F(Installed, FindsPluginsAndLibrariesBesideItself) {
    std::filesystem::copy(std::string(TEST_CLIENTS) + "/own/liblumo.so.1", place / "lib/liblumo.so.1");
    EXPECT_EQ(ask(), 1);
    EXPECT_EQ(process.errors(), "tovicli: answered by own: noted by own\n");
}

TEST_F(Installed, APreloadedLibraryWins) {
    std::filesystem::copy(std::string(TEST_CLIENTS) + "/own/liblumo.so.1", place / "lib/liblumo.so.1");
    auto const preload = [] {
        setenv("LD_PRELOAD", (std::string(TEST_CLIENTS) + "/substitute/liblumo.so.1").c_str(), 1);
    };
    EXPECT_EQ(ask(preload), 1);
    EXPECT_EQ(process.errors(), "tovicli: answered by substitute: noted by substitute\n");
}

TEST_F(Installed, WithoutTheLibraryThePluginIsNamedAndTheCommandUnavailable) {
    EXPECT_EQ(ask(), 3);
    EXPECT_THAT(process.errors(), StartsWith("tovicli: warning: plug-in 'uses_client.so' skipped: it needs "
                                             "liblumo.so.1, which cannot be loaded: "));
}

} // namespace
