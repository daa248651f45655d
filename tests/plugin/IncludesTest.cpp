// SPDX-License-Identifier: Apache-2.0
//
// The plug-in stands on the interfaces, Boost and the standard library alone.
#include <filesystem>
#include <fstream>
#include <regex>
#include <set>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace {

namespace fs = std::filesystem;

bool isAllowed(std::string const &include, fs::path const &folder) {
    static std::regex const standard("<[a-z0-9_]+>");
    static std::regex const boost("<boost/[a-z0-9_/]+\\.hpp>");
    static std::regex const interface("\"(plexa|gantry|kestrel|lumolib)/[A-Za-z]+\\.h\"");
    static std::regex const sibling("\"[A-Za-z]+\\.h\"");
    std::string const file = include.substr(1, include.size() - 2);
    if (std::regex_match(include, interface)) {
        return fs::exists(fs::path(INTERFACES_DIRECTORY) / file);
    }
    if (std::regex_match(include, sibling)) {
        return fs::exists(folder / file);
    }
    return std::regex_match(include, standard) || std::regex_match(include, boost);
}

TEST(PluginSources, IncludeInterfacesBoostAndTheStandardLibraryAlone) {
    std::regex const directive("\\s*#\\s*include\\s*(\\S+).*");
    fs::path const folder = PLUGIN_DIRECTORY;
    std::vector<std::string> strangers;
    std::size_t checked = 0;
    for (fs::directory_entry const &entry : fs::directory_iterator(folder)) {
        if (entry.path().extension() != ".h" && entry.path().extension() != ".cpp") {
            continue;
        }
        std::ifstream source(entry.path());
        for (std::string line; std::getline(source, line);) {
            std::smatch match;
            if (std::regex_match(line, match, directive)) {
                ++checked;
                if (!isAllowed(match[1], folder)) {
                    strangers.push_back(entry.path().filename().string() + ": " + line);
                }
            }
        }
    }
    EXPECT_THAT(strangers, testing::IsEmpty());
    EXPECT_GT(checked, 100U) << "sources were not found";
}

TEST(PluginSources, HaveOneUnitForEachCommandClass) {
    fs::path const folder = PLUGIN_DIRECTORY;
    std::size_t units = 0;
    for (fs::directory_entry const &entry : fs::directory_iterator(folder)) {
        if (entry.path().extension() != ".h") {
            continue;
        }
        std::ifstream header(entry.path());
        std::string const text{std::istreambuf_iterator<char>(header), std::istreambuf_iterator<char>()};
        std::string const name = entry.path().stem().string();
        if (text.find("class LUMO_COMMAND_EXPORT " + name + " ") != std::string::npos) {
            ++units;
            EXPECT_TRUE(fs::exists(folder / (name + ".cpp"))) << name;
        }
    }
    EXPECT_EQ(units, 27U);
}

} // namespace
