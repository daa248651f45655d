// SPDX-License-Identifier: Apache-2.0
//
// The plug-in as a file: what it needs, what it shows, and that the libraries under it can be substituted. This program
// exports the doubles, so that they stand in front of the platform's libraries when the plug-in is loaded.
#include <cstdio>
#include <regex>
#include <set>
#include <sstream>

#include <dlfcn.h>

#include "CommandTest.h"
#include "plexa/AutoCli.h"

using namespace PluginTest;
using Plexa::AutoCli::Namespace;

namespace {

/// The lines that a program prints.
std::vector<std::string> linesOf(std::string const &commandLine) {
    std::vector<std::string> lines;
    std::string text;
    FILE *const pipe = popen(commandLine.c_str(), "r");
    for (int next = std::fgetc(pipe); next != EOF; next = std::fgetc(pipe)) {
        text += static_cast<char>(next);
    }
    EXPECT_EQ(pclose(pipe), 0) << commandLine;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);) {
        lines.push_back(line);
    }
    return lines;
}

std::set<std::string> dynamicEntries(std::string const &tag) {
    std::regex const entry(".*\\(" + tag + "\\).*\\[(.*)\\].*");
    std::set<std::string> values;
    for (std::string const &line : linesOf("readelf -dW " PLUGIN_LIBRARY)) {
        std::smatch match;
        if (std::regex_match(line, match, entry)) {
            values.insert(match[1]);
        }
    }
    return values;
}

TEST(PluginLibrary, NeedsThePlatformByTheVersionsThatItWasBuiltFor) {
    EXPECT_THAT(dynamicEntries("NEEDED"), testing::IsSupersetOf({"libplexa.so.1", "libkestrel.so.1", "liblumo.so.1"}));
}

TEST(PluginLibrary, NamesNoPlaceToLookForLibraries) {
    EXPECT_THAT(dynamicEntries("RUNPATH"), IsEmpty());
    EXPECT_THAT(dynamicEntries("RPATH"), IsEmpty());
}

TEST(PluginLibrary, ShowsItsEntryPointAndTheCommandClassesAlone) {
    // What templates and inline functions of other headers leave is weak, and everybody's.
    std::regex const strong("[0-9a-f]+ ([TDBRU]) (.*)");
    std::regex const counters(" __(start_|stop_)?(__)?llvm_pro?f"); // of a build that counts what runs
    std::regex const member("(?:.* for |.* to |.*-in-)?TarselCli::LumoNamespace::([A-Za-z]+)(?:::.*)?");
    std::set<std::string> classes;
    std::vector<std::string> others;
    for (std::string const &line : linesOf("nm -DC --defined-only " PLUGIN_LIBRARY)) {
        std::smatch match;
        if (!std::regex_match(line, match, strong) || std::regex_search(line, counters)) {
            continue;
        }
        std::string const name = match[2];
        std::smatch owner;
        if (std::regex_match(name, owner, member)) {
            classes.insert(owner[1]);
        } else {
            others.push_back(name);
        }
    }
    EXPECT_THAT(others, ElementsAre("AutoCli_RegisterNamespaces"));
    EXPECT_EQ(classes.size(), 27U);
    EXPECT_EQ(classes.count("CGCreate") + classes.count("VendorProviderAdd") + classes.count("VirtualVolumeGet"), 3U);
}

class SubstitutedPlatform : public CommandTest {};

TEST_F(SubstitutedPlatform, ServesAPluginThatIsLoadedBehindIt) {
    void *const library = dlopen(PLUGIN_LIBRARY, RTLD_NOW | RTLD_LOCAL);
    ASSERT_NE(library, nullptr) << dlerror();
    using EntryPoint = void (*)(boost::shared_ptr<Namespace> &);
    auto const registerNamespaces = reinterpret_cast<EntryPoint>(dlsym(library, "AutoCli_RegisterNamespaces"));
    ASSERT_NE(registerNamespaces, nullptr);

    auto root = Namespace::New();
    root->RegisterNamespaceNode(Namespace::New(), "storage");
    registerNamespaces(root);
    EXPECT_EQ(lumo.openSessions, 7);

    std::size_t consumed = 0;
    auto const add = root->ResolveNode({"storage", "internal", "lumo", "orkaprovider", "add"}, consumed);
    EXPECT_EQ(consumed, 5U);
    input->SetString("vp-name", "north");
    kestrel.updateLumoVendorProvider.throwOnce(gantryFailure("substituted"));
    add->GetDispatcher()(input, output);
    expectMessageAlone("Failed to add VP: substituted");

    lumo.init.always(false);
    auto const enable = root->ResolveNode({"storage", "internal", "lumo", "faultInjection", "enable"}, consumed);
    expectNoSession([&] { enable->GetDispatcher()(input, output); }, "FaultInjectionEnable", 68);
    // The library stays loaded: nodes of the tree are its objects.
}

} // namespace
