// SPDX-License-Identifier: Apache-2.0
//
// Plug-in directories as they should not be, and what is loaded from them all the same.
#include <filesystem>
#include <fstream>

#include <elf.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

#include "PluginLoader.h"
#include "TemporaryDirectory.h"

namespace {

using namespace Plexa::AutoCli;
using namespace Tovicli;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using Names = std::vector<std::string>;

class Loader : public ::testing::Test {
protected:
    Loader() {
        unsetenv("TOVI_OFFLINE");
        unsetenv("TEST_NEVER_A_SESSION");
        root->RegisterNamespaceNode(storage, "storage");
    }
    ~Loader() override {
        unsetenv("TOVI_OFFLINE");
        unsetenv("TEST_NEVER_A_SESSION");
        unsetenv("TEST_SWAP_NEW");
        unsetenv("TEST_SWAP_OLD");
    }

    Registration load(std::string const &path) {
        return loader.registerInto(root, path, environment);
    }
    Names names() {
        return storage->GetNamespaceNodeNames();
    }

    // The loader first: what the tree holds must go before it.
    PluginLoader loader{"/nonexistent", geteuid()};
    boost::shared_ptr<Namespace> root = Namespace::New();
    boost::shared_ptr<Namespace> storage = Namespace::New();
    ProcessEnvironment environment;
    TemporaryDirectory directory;
};

TEST_F(Loader, LoadsWhatTheDirectoryHolds) {
    directory.addPlugin("behaves", "a.so");
    writeFile(directory / "README", "not looked at");
    EXPECT_THAT(load(directory.path()).troubles, IsEmpty());
    EXPECT_EQ(names(), (Names{"sample"}));
}

TEST_F(Loader, RegistersAgainInAnotherTreeWithoutLoadingAgain) {
    directory.addPlugin("behaves", "a.so");
    load(directory.path());
    boost::shared_ptr<Namespace> second = Namespace::New();
    second->SubNamespace("storage");
    EXPECT_THAT(loader.registerInto(second, directory.path(), environment).troubles, IsEmpty());
    EXPECT_TRUE(second->GetNamespaceNode("storage")->HasNamespaceNode("sample"));
}

TEST_F(Loader, AbsentDirectoryIsATrouble) {
    EXPECT_THAT(load(directory / "none").troubles,
                ElementsAre("no plug-ins from '" + directory.path() + "/none': No such file or directory"));
}

TEST_F(Loader, fault_7_NothingIsLoadedFromADirectoryThatOthersCanWrite) {
    directory.addPlugin("behaves", "a.so");
    for (mode_t const mode : {0777U, 0770U, 01777U, 0720U}) {
        chmod(directory.path().c_str(), mode);
        PluginLoader fresh("/nonexistent", geteuid());
        EXPECT_THAT(fresh.registerInto(root, directory.path(), environment).troubles,
                    ElementsAre("no plug-ins from '" + directory.path() + "': '" + directory.path() +
                                "' can be written by others"));
    }
    EXPECT_THAT(names(), IsEmpty());
}

TEST_F(Loader, fault_8_NothingIsLoadedBelowADirectoryThatOthersCanWrite) {
    std::filesystem::create_directory(directory / "inner");
    directory.addPlugin("behaves", "inner/a.so");
    chmod(directory.path().c_str(), 0777);
    EXPECT_THAT(load(directory / "inner").troubles, ElementsAre("no plug-ins from '" + directory.path() + "/inner': '" +
                                                                directory.path() + "' can be written by others"));
    EXPECT_THAT(names(), IsEmpty());
}

TEST_F(Loader, fault_8_StickyDirectoryOfRootsIsGoodEnoughAbove) {
    if (geteuid() != 0) {
        GTEST_SKIP() << "only root makes a directory of root's";
    }
    std::filesystem::create_directory(directory / "inner");
    directory.addPlugin("behaves", "inner/a.so");
    chmod(directory.path().c_str(), 01777);
    EXPECT_THAT(load(directory / "inner").troubles, IsEmpty());
    EXPECT_EQ(names(), (Names{"sample"}));
}

TEST_F(Loader, fault_8_OwnerMustBeRootOrTheUser) {
    if (geteuid() != 0) {
        GTEST_SKIP() << "only root gives files away";
    }
    directory.addPlugin("behaves", "a.so");
    ASSERT_EQ(chown(directory.path().c_str(), 4711, 4711), 0);
    EXPECT_THAT(load(directory.path()).troubles,
                ElementsAre("no plug-ins from '" + directory.path() + "': '" + directory.path() +
                            "' belongs to neither root nor the user"));
    EXPECT_THAT(names(), IsEmpty());
    PluginLoader of4711("/nonexistent", 4711);
    EXPECT_THAT(of4711.registerInto(root, directory.path(), environment).troubles, IsEmpty());
}

TEST_F(Loader, fault_8_FilesMustBeOursToo) {
    directory.addPlugin("behaves", "a.so");
    chmod((directory / "a.so").c_str(), 0666);
    EXPECT_THAT(load(directory.path()).troubles, ElementsAre("plug-in 'a.so' skipped: it can be written by others"));
}

TEST_F(Loader, fault_9_LinksFifosDirectoriesAndDevicesAreSkippedWithoutBlocking) {
    TemporaryDirectory elsewhere;
    elsewhere.addPlugin("behaves", "target.so");
    std::filesystem::create_symlink(elsewhere / "target.so", directory / "a-link.so");
    ASSERT_EQ(mkfifo((directory / "b-fifo.so").c_str(), 0600), 0);
    std::filesystem::create_directory(directory / "c-directory.so");
    directory.addPlugin("behaves", "e.so");
    Names troubles{"plug-in 'a-link.so' skipped: it is a symbolic link",
                   "plug-in 'b-fifo.so' skipped: it is no regular file",
                   "plug-in 'c-directory.so' skipped: it is no regular file"};
    // Not everybody may make a device. This one can be opened, and reading it says that it is an empty file.
    if (mknod((directory / "d-device.so").c_str(), S_IFCHR | 0600, makedev(1, 3)) == 0) {
        troubles.emplace_back("plug-in 'd-device.so' skipped: it is no regular file");
    }
    EXPECT_EQ(load(directory.path()).troubles, troubles);
    EXPECT_EQ(names(), (Names{"sample"}));
}

TEST_F(Loader, fault_10_WhatWasCheckedIsWhatLoads) {
    directory.addPlugin("swaps", "a.so"); // every file has been checked when the first is loaded
    directory.addPlugin("behaves", "b.so");
    directory.addPlugin("throws", "other");
    setenv("TEST_SWAP_NEW", (directory / "other").c_str(), 1);
    setenv("TEST_SWAP_OLD", (directory / "b.so").c_str(), 1);
    EXPECT_THAT(load(directory.path()).troubles, IsEmpty());
    EXPECT_EQ(names(), (Names{"sample"}));
    EXPECT_EQ(readFile(directory / "b.so"), readFile(std::string(TEST_PLUGIN_DIRECTORY) + "/throws.so"));
}

TEST_F(Loader, fault_10_ADescriptorsNumberIsNotUsedForTwoLibraries) {
    // The first directory leaves skipped files behind, the second would get their numbers.
    directory.addPlugin("no_entry", "a.so");
    load(directory.path());
    TemporaryDirectory second;
    second.addPlugin("behaves", "a.so");
    EXPECT_THAT(load(second.path()).troubles, IsEmpty());
    EXPECT_EQ(names(), (Names{"sample"}));
}

TEST_F(Loader, fault_11_DamagedFilesAreSkippedAndOthersWork) {
    std::string const good = readFile(std::string(TEST_PLUGIN_DIRECTORY) + "/behaves.so");
    std::string foreign = good;
    foreign[offsetof(Elf64_Ehdr, e_machine)] = static_cast<char>(EM_S390);
    std::string otherClass = good;
    otherClass[EI_CLASS] = static_cast<char>(good[EI_CLASS] == ELFCLASS64 ? ELFCLASS32 : ELFCLASS64);
    std::string wild = good;
    std::fill_n(wild.begin() + offsetof(Elf64_Ehdr, e_phoff), 8, '\xff');
    writeFile(directory / "a-empty.so", "");
    writeFile(directory / "b-text.so", std::string(4096, 'x'));
    writeFile(directory / "c-header.so", good.substr(0, 100));
    writeFile(directory / "d-half.so", good.substr(0, good.size() / 2));
    writeFile(directory / "e-foreign.so", foreign);
    writeFile(directory / "f-class.so", otherClass);
    writeFile(directory / "g-wild.so", wild);
    directory.addPlugin("behaves", "h.so");
    EXPECT_THAT(
        load(directory.path()).troubles,
        ElementsAre("plug-in 'a-empty.so' skipped: it is no ELF file", "plug-in 'b-text.so' skipped: it is no ELF file",
                    "plug-in 'c-header.so' skipped: it is truncated", "plug-in 'd-half.so' skipped: it is truncated",
                    "plug-in 'e-foreign.so' skipped: it was built for another machine",
                    "plug-in 'f-class.so' skipped: it was built for another machine",
                    "plug-in 'g-wild.so' skipped: it is truncated"));
    EXPECT_EQ(names(), (Names{"sample"}));
}

TEST_F(Loader, fault_11_EveryTruncationIsNoticed) {
    std::string const good = readFile(std::string(TEST_PLUGIN_DIRECTORY) + "/behaves.so");
    for (std::size_t length = 0; length < good.size(); length += 997) {
        writeFile(directory / "a.so", good.substr(0, length));
        PluginLoader fresh("/nonexistent", geteuid());
        EXPECT_EQ(fresh.registerInto(root, directory.path(), environment).troubles.size(), 1U) << length;
    }
    EXPECT_THAT(names(), IsEmpty());
}

TEST_F(Loader, fault_12_WithoutEntryPointItIsSkipped) {
    directory.addPlugin("no_entry", "a.so");
    EXPECT_THAT(load(directory.path()).troubles,
                ElementsAre("plug-in 'a.so' skipped: it has no entry point AutoCli_RegisterNamespaces"));
}

TEST_F(Loader, fault_13_AnotherVersionIsSkippedAndBothAreShown) {
    directory.addPlugin("other_version", "a.so");
    directory.addPlugin("behaves", "b.so");
    EXPECT_THAT(load(directory.path()).troubles,
                ElementsAre("plug-in 'a.so' skipped: it was built against libplexa.so.2, this tool has libplexa.so.1"));
    EXPECT_EQ(names(), (Names{"sample"}));
}

TEST_F(Loader, fault_14_AThrowingPluginIsNamedAndKeepsWhatItRegistered) {
    directory.addPlugin("throws", "a.so");
    directory.addPlugin("behaves", "b.so");
    EXPECT_THAT(load(directory.path()).troubles, ElementsAre("plug-in 'a.so' failed: no more\x1b"));
    EXPECT_EQ(names(), (Names{"half", "sample"}));
}

TEST_F(Loader, fault_15_OfTwoWithOneNameTheFirstInSortedOrderWins) {
    directory.addPlugin("collides", "b.so");
    directory.addPlugin("behaves", "a.so");
    EXPECT_THAT(load(directory.path()).troubles,
                ElementsAre("plug-in 'b.so' failed: the name 'sample' is already taken in 'storage'"));
    EXPECT_EQ(names(), (Names{"sample", "unshared"}));
    EXPECT_TRUE(storage->GetNamespaceNode("sample")->HasNamespaceNode("answer"));
}

TEST_F(Loader, fault_33_WithoutDaemonAPluginIsRegisteredAgainOffline) {
    directory.addPlugin("needs_daemon", "a.so");
    Registration const registration = load(directory.path());
    EXPECT_TRUE(registration.daemonMissing);
    EXPECT_THAT(registration.troubles, IsEmpty());
    EXPECT_EQ(names(), (Names{"early", "late"}));
    EXPECT_EQ(environment.get("TOVI_OFFLINE"), "1");
}

TEST_F(Loader, fault_33_FailingOfflineTooIsATrouble) {
    setenv("TEST_NEVER_A_SESSION", "1", 1);
    directory.addPlugin("needs_daemon", "a.so");
    EXPECT_THAT(load(directory.path()).troubles, ElementsAre("plug-in 'a.so' failed: Unable to initialize lumoLib"));
    EXPECT_EQ(names(), (Names{"early"}));
}

TEST_F(Loader, WithoutClientLibraryThereIsNoLastFailure) {
    loader.clearLastFailure();
    EXPECT_FALSE(loader.lastFailure().has_value());
}

} // namespace
