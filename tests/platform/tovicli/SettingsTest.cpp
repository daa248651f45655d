// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "Settings.h"
#include "plexa/UsageError.h"

namespace {

using namespace Plexa;
using namespace Tovicli;

Defaults const defaults{"/usr/lib/tovicli/plugins", "/cwd"};

/// Reads one option and one variable; the sentence of the mistake, or what `print` makes of the settings.
template <typename Print>
std::string with(std::string const &option, std::string const &value, std::string const &variable,
                 std::string const &variableValue, Print const &print) {
    auto const options = CallSpec::Input::New();
    if (!option.empty()) {
        options->SetString(option, value);
    }
    MapEnvironment environment;
    if (!variable.empty()) {
        environment.set(variable, variableValue);
    }
    try {
        return print(settingsFrom(*options, &environment, defaults));
    } catch (UsageError const &mistake) {
        return mistake.sentence();
    }
}

std::string timeoutOf(std::string const &option, std::string const &variable) {
    return with(option.empty() ? "" : "timeout", option, variable.empty() ? "" : "TOVI_TIMEOUT_MS", variable,
                [](Settings const &settings) { return std::to_string(settings.timeoutMs); });
}

TEST(Settings, TimeoutIsReadInSecondsOrMilliseconds) {
    EXPECT_EQ(timeoutOf("", ""), "30000");
    EXPECT_EQ(timeoutOf("5", ""), "5000");
    EXPECT_EQ(timeoutOf("5s", ""), "5000");
    EXPECT_EQ(timeoutOf("500ms", ""), "500");
    EXPECT_EQ(timeoutOf("86400", ""), "86400000");
    EXPECT_EQ(timeoutOf("", "750"), "750");
    EXPECT_EQ(timeoutOf("2", "750"), "2000");
    std::string const forms = " is no timeout; seconds, or milliseconds as in 500ms, from 1ms to 86400 are expected";
    for (std::string const wrong : {"0", "-1", "86401", "ms", "s", "abc", "1.5", "99999999999999999999", "5 s"}) {
        EXPECT_EQ(timeoutOf(wrong, ""), "--timeout: '" + wrong + "'" + forms);
    }
    EXPECT_EQ(timeoutOf("", "soon"), "TOVI_TIMEOUT_MS: 'soon'" + forms);
}

TEST(Settings, DirectoriesAreMadeAbsolute) {
    auto const root = [](Settings const &settings) { return settings.root; };
    EXPECT_EQ(with("", "", "", "", root), "/var/lib/tovi");
    EXPECT_EQ(with("root", "/a/b/", "", "", root), "/a/b");
    EXPECT_EQ(with("root", "lab", "TOVI_ROOT", "/x", root), "/cwd/lab");
    EXPECT_EQ(with("", "", "TOVI_ROOT", "/x", root), "/x");
    EXPECT_EQ(with("", "", "TOVI_ROOT", "", root), "/var/lib/tovi");
    EXPECT_EQ(with("root", "/", "", "", root), "/");
    EXPECT_EQ(with("root", "", "", "", root), "--root: a directory is expected, an empty text was given");
    auto const plugins = [](Settings const &settings) { return settings.pluginDirectory; };
    EXPECT_EQ(with("", "", "", "", plugins), "/usr/lib/tovicli/plugins");
    EXPECT_EQ(with("", "", "TOVI_PLUGINS", "p", plugins), "/cwd/p");
}

TEST(Settings, LogLevelIsOneOfTheKnown) {
    auto const level = [](Settings const &settings) { return settings.logLevel.value_or("none"); };
    EXPECT_EQ(with("", "", "", "", level), "none");
    EXPECT_EQ(with("log-level", "VERBOSE", "", "", level), "verbose");
    EXPECT_EQ(with("", "", "TOVI_LOG_LEVEL", "error", level), "error");
    EXPECT_EQ(with("log-level", "loud", "", "", level),
              "--log-level: 'loud' is no log level; there is quiet, panic, error, warning, info, verbose, trivia");
}

TEST(Settings, WithoutEnvironmentDirectoriesCannotBeChosen) {
    auto const options = CallSpec::Input::New();
    EXPECT_EQ(settingsFrom(*options, nullptr, defaults).root, "/var/lib/tovi");
    options->SetString("plugins", "/evil");
    EXPECT_THROW(settingsFrom(*options, nullptr, defaults), UsageError);
}

} // namespace
