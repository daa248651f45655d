// SPDX-License-Identifier: Apache-2.0
//
// What a process of the tool loads. A library that is merely linked costs every command's start, the Cap'n Proto
// library more than all of ours together.
#include <cstdio>
#include <memory>
#include <string>

#include <gtest/gtest.h>

namespace {

/// The libraries that a file says it needs, as readelf prints them.
std::string neededBy(std::string const &path) {
    std::unique_ptr<FILE, int (*)(FILE *)> const pipe(popen(("readelf -dW '" + path + "'").c_str(), "r"), &pclose);
    std::string needed;
    char line[1024];
    while (pipe && std::fgets(line, sizeof line, pipe.get()) != nullptr) {
        if (std::string(line).find("(NEEDED)") != std::string::npos) {
            needed += line;
        }
    }
    return needed;
}

class Libraries : public testing::TestWithParam<char const *> {};

TEST_P(Libraries, of_clients_do_without_the_message_library) {
    std::string const needed = neededBy(GetParam());
    EXPECT_NE(needed.find("libc.so"), std::string::npos) << "nothing was read: " << needed;
    EXPECT_EQ(needed.find("libcapnp"), std::string::npos) << needed;
    EXPECT_EQ(needed.find("libkj"), std::string::npos) << needed;
}

INSTANTIATE_TEST_SUITE_P(all, Libraries,
                         testing::Values(TEST_LIBLUMO, TEST_LIBKESTREL, TEST_LIBPLEXA, TEST_PLUGIN, TEST_TOVICLI));

TEST(LibrariesOfTheDaemon, are_told_apart_by_the_same_look) {
    EXPECT_NE(neededBy(TEST_LUMOD).find("libcapnp"), std::string::npos) << "the look does not see what it looks for";
}

} // namespace
