// SPDX-License-Identifier: Apache-2.0
#include "https/Url.h"

#include <string>

#include <gtest/gtest.h>

#include "wire/Failure.h"

namespace {

/// "authority path", or why the URL is refused.
std::string parsed(std::string const &url) {
    try {
        Orka::Https::Url const parts = Orka::Https::parseUrl(url);
        return parts.authority() + ' ' + parts.path;
    } catch (Wire::Failure const &failure) {
        std::string const head = "the provider URL '" + url + "' cannot be used: ";
        EXPECT_EQ(failure.sentence().substr(0, head.size()), head);
        return failure.sentence().substr(head.size());
    }
}

TEST(Url, IsTakenApart) {
    EXPECT_EQ(parsed("https://array.test"), "array.test:443 ");
    EXPECT_EQ(parsed("https://array.test/"), "array.test:443 ");
    EXPECT_EQ(parsed("https://A-z_09.test:1/orka//"), "A-z_09.test:1 /orka");
    EXPECT_EQ(parsed("https://Z.a:65535/a/~b%20c!$&'()*+,;=:@"), "Z.a:65535 /a/~b%20c!$&'()*+,;=:@");
    EXPECT_EQ(parsed("https://192.0.2.10:8443/orka"), "192.0.2.10:8443 /orka");
    EXPECT_EQ(parsed("https://[2001:db8::aF09]:8443/x"), "[2001:db8::aF09]:8443 /x");
    EXPECT_EQ(parsed("https://[::ffff:192.0.2.10]"), "[::ffff:192.0.2.10]:443 ");
}

TEST(Url, EachCharacterThatMayNotStandInItsPlaceIsRefused) {
    for (char const character : std::string("\x01 !$%&'()*+,;<=>\\^`{|}~\x7f\xff\"")) {
        EXPECT_EQ(parsed(std::string("https://a") + character + "z/"), "its host is no name and no address")
            << static_cast<int>(character);
    }
    for (char const character : std::string("/@Gg[`_-\xff")) {
        std::string const why = character == '/'   ? "the ']' that ends its address is missing"
                                : character == '@' ? "it may not name a user"
                                                   : "between its brackets stands no address";
        EXPECT_EQ(parsed(std::string("https://[:") + character + ":]"), why) << static_cast<int>(character);
    }
    for (char const character : std::string("\x01 \"<>\\^`{|}\x7f\xff")) {
        EXPECT_EQ(parsed(std::string("https://host/a") + character),
                  "its path holds a character that has to be written as %XX")
            << static_cast<int>(character);
    }
    for (std::string const path : {"?", "/?", "/#", "#x", "/orka?x=y"}) {
        EXPECT_EQ(parsed("https://host" + path), "it may hold neither '?' nor '#'");
    }
}

TEST(Url, AHostIsNoSocketOfThisMachine) {
    for (std::string const host : {"unix", "unix-abstract", "unix:8443"}) {
        EXPECT_EQ(parsed("https://" + host), "its host cannot be told from a local socket; name it with its domain");
    }
    EXPECT_EQ(parsed("https://unix.example:8443"), "unix.example:8443 ");
}

TEST(Url, APortIsANumberBehindAColon) {
    for (std::string const port : {":", ":0", ":65536", ":99999999999999999999", ":-1", ":1x", ": 1", ":x"}) {
        EXPECT_EQ(parsed("https://host" + port), "its port is no number from 1 to 65535") << port;
    }
    EXPECT_EQ(parsed("https://[::1]8443"), "its port is no number from 1 to 65535");
    EXPECT_EQ(parsed("https://[]:1"), "it names no host, as https://host:port/path does");
    EXPECT_EQ(parsed("https://:1"), "it names no host, as https://host:port/path does");
}

} // namespace
