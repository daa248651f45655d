// SPDX-License-Identifier: Apache-2.0
//
// What speaks against a plug-in, each thing by itself and several at once.
#include <chrono>
#include <filesystem>

#include <elf.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "TemporaryDirectory.h"
#include "plugins/Directory.h"
#include "plugins/Inspection.h"
#include "plugins/Trial.h"

namespace {

using namespace Tovicli::Cli;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

class Inspecting : public ::testing::Test {
protected:
    /// "check: detail" each.
    std::vector<std::string> findings(std::string const &file) {
        std::vector<std::string> texts;
        for (Finding const &finding : inspect({file, loadedBefore(file, directory.path()), TEST_LIBRARIES, timeout})) {
            texts.push_back(finding.check + ": " + finding.detail);
        }
        return texts;
    }
    std::string good() {
        return readFile(std::string(TEST_PLUGIN_DIRECTORY) + "/behaves.so");
    }

    TemporaryDirectory directory;
    std::chrono::milliseconds timeout{60000};
};

TEST_F(Inspecting, NothingSpeaksAgainstAPluginThatBehaves) {
    directory.addPlugin("behaves", "a.so");
    EXPECT_THAT(findings(directory / "a.so"), IsEmpty());
    EXPECT_THAT(findings(std::string(TEST_REAL_PLUGINS) + "/liblumointernal.so"), IsEmpty());
    EXPECT_EQ(abiOf(std::string(TEST_REAL_PLUGINS) + "/liblumointernal.so"),
              "libplexa.so.1 libkestrel.so.1 liblumo.so.1");
}

TEST_F(Inspecting, WhatIsNoFileToLoad) {
    EXPECT_THAT(findings(directory / "none.so"), ElementsAre("file: No such file or directory"));
    directory.addPlugin("behaves", "a.so");
    std::filesystem::create_symlink(directory / "a.so", directory / "link.so");
    EXPECT_THAT(findings(directory / "link.so"), ElementsAre("file: it is a symbolic link"));
    ASSERT_EQ(mkfifo((directory / "fifo.so").c_str(), 0600), 0);
    EXPECT_THAT(findings(directory / "fifo.so"), ElementsAre("file: it is no regular file"));
}

TEST_F(Inspecting, EachRuleThatIsBrokenIsARow) {
    directory.addPlugin("other_version", "plugin.txt");
    chmod((directory / "plugin.txt").c_str(), 0666);
    EXPECT_THAT(findings(directory / "plugin.txt"),
                ElementsAre("file: its name does not end in .so; nothing else of a plug-in directory is looked at",
                            "permissions: it can be written by others",
                            "abi: it was built against libplexa.so.2, this tool has libplexa.so.1"));
}

TEST_F(Inspecting, ADirectoryThatOthersCanWriteSpeaksAgainstItsFiles) {
    directory.addPlugin("behaves", "a.so");
    chmod(directory.path().c_str(), 0777);
    EXPECT_THAT(findings(directory / "a.so"),
                ElementsAre("permissions: its directory: '" + directory.path() + "' can be written by others"));
}

TEST_F(Inspecting, fault_10_WhatWasLookedAtIsWhatIsTried) {
    directory.addPlugin("behaves", "a.so");
    TemporaryDirectory elsewhere;
    elsewhere.addPlugin("crashes", "a.so");
    TemporaryDirectory place;
    std::filesystem::create_symlink(directory.path(), place / "link");
    Question const question{place / "link/a.so", {}, TEST_LIBRARIES, timeout};
    Inspected const inspected = inspectFile(question.file);
    EXPECT_THAT(inspected.findings, IsEmpty());
    std::filesystem::create_symlink(elsewhere.path(), place / "other");
    std::filesystem::rename(place / "other", place / "link");
    EXPECT_THAT(tryOut(question, inspected.file), IsEmpty());
}

TEST_F(Inspecting, WhatIsNoLibraryOfThisMachine) {
    writeFile(directory / "text.so", std::string(4096, 'x'));
    writeFile(directory / "half.so", good().substr(0, good().size() / 2));
    std::string foreign = good();
    foreign[offsetof(Elf64_Ehdr, e_machine)] = static_cast<char>(EM_S390);
    writeFile(directory / "foreign.so", foreign);
    std::string otherClass = good();
    otherClass[EI_CLASS] = static_cast<char>(otherClass[EI_CLASS] == ELFCLASS64 ? ELFCLASS32 : ELFCLASS64);
    writeFile(directory / "class.so", otherClass);
    EXPECT_THAT(findings(directory / "text.so"), ElementsAre("elf: it is no ELF file"));
    EXPECT_THAT(findings(directory / "half.so"), ElementsAre("elf: it is truncated"));
    EXPECT_THAT(findings(directory / "foreign.so"), ElementsAre(HasSubstr("machine: it was built for machine 22")));
    EXPECT_THAT(findings(directory / "class.so"),
                ElementsAre("class: it was built for 32 bits, this tool for 64 bits"));
}

TEST_F(Inspecting, MissingEntryPointAndMissingSymbols) {
    directory.addPlugin("no_entry", "a.so");
    EXPECT_THAT(findings(directory / "a.so"),
                ElementsAre("entry point: it has no entry point AutoCli_RegisterNamespaces"));
    directory.addPlugin("unresolved", "b.so");
    EXPECT_THAT(findings(directory / "b.so"),
                ElementsAre("symbol: nothing that it needs has the symbol Test_NobodyHasThis",
                            "symbol: nothing that it needs has the symbol Test_NorThis"));
}

TEST_F(Inspecting, ARegistrationThatFails) {
    directory.addPlugin("throws", "a.so");
    EXPECT_THAT(findings(directory / "a.so"), ElementsAre("registration: no more\x1b"));
}

TEST_F(Inspecting, NamesThatAreTaken) {
    directory.addPlugin("behaves", "a.so");
    directory.addPlugin("collides", "b.so");
    EXPECT_THAT(findings(directory / "b.so"), ElementsAre("name: the name 'sample' is already taken in 'storage'"));
    EXPECT_THAT(findings(directory / "a.so"), IsEmpty()); // its turn comes first
    TemporaryDirectory elsewhere;
    elsewhere.addPlugin("behaves", "c.so");
    std::vector<std::string> const taken = findings(elsewhere / "c.so");
    ASSERT_GT(taken.size(), 1U);
    EXPECT_THAT(taken.front(), HasSubstr("name: the command 'storage sample answer' is another plug-in's already"));
    EXPECT_THAT(taken.back(), HasSubstr("is already taken in 'storage sample'"));
}

TEST_F(Inspecting, ACrashTakesOnlyTheTrialsProcess) {
    directory.addPlugin("crashes", "a.so");
    EXPECT_THAT(findings(directory / "a.so"), ElementsAre("load: it ended the process that loaded it, with status 7"));
}

TEST_F(Inspecting, APluginThatHangsIsGivenUp) {
    directory.addPlugin("hangs", "a.so");
    timeout = std::chrono::milliseconds(200);
    EXPECT_THAT(findings(directory / "a.so"), ElementsAre("registration: it was not done within 200 ms"));
}

} // namespace
