// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

#include <algorithm>
#include <filesystem>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "wire/UniqueFd.h"

using namespace Orka;

class MakingAnArrayFile : public OrkaTest {
protected:
    static Topology other() {
        return parseTopology(R"({"arrays": [{"id": "other"}]})", "other");
    }
};

TEST_F(MakingAnArrayFile, holdsWhatTheTopologyTells) {
    auto const topology = parseTopology(sampleTopology(), "sample");
    makeArrayFile(topology, at("x.array"), Replace::Never);
    ArrayFile file(at("x.array"));
    auto const inventory = file.inventory();
    EXPECT_EQ(inventory.arrays, topology.arrays);
    EXPECT_EQ(inventory.containers, topology.containers);
    ASSERT_EQ(topology.volumes.size(), 3U);
    for (auto const &[volume, metadata] : topology.volumes) {
        EXPECT_EQ(file.volume(volume.containerId, volume.uuid), volume);
        EXPECT_EQ(file.metadata(volume.containerId, volume.uuid), metadata);
    }
    file.checkIntegrity();
}

TEST_F(MakingAnArrayFile, givesTheSameBytesForTheSameTopology) {
    makeArray("a");
    makeArray("b");
    EXPECT_EQ(bytesOf(at("a")), bytesOf(at("b")));
}

TEST_F(MakingAnArrayFile, leavesNoOtherFileBehind) {
    makeArray();
    EXPECT_EQ(filesInDirectory(), std::vector<std::string>{"test.array"});
}

TEST_F(MakingAnArrayFile, refusesAFileThatExists) {
    writeBytes(at("test.array"), "precious");
    EXPECT_EQ(failureOf([&] { makeArray(); }), "'" + at("test.array") + "' exists already");
    EXPECT_EQ(codeOf([&] { makeArray(); }), Wire::ErrorCode::AlreadyExists);
    EXPECT_EQ(bytesOf(at("test.array")), "precious");
    EXPECT_EQ(filesInDirectory(), std::vector<std::string>{"test.array"});
}

TEST_F(MakingAnArrayFile, refusesADanglingLink) {
    ASSERT_EQ(symlink("/nonexistent/target", at("test.array").c_str()), 0);
    EXPECT_EQ(codeOf([&] { makeArray(); }), Wire::ErrorCode::AlreadyExists);
}

TEST_F(MakingAnArrayFile, refusesANameWhoseJournalWaitsForAnotherFile) {
    writeBytes(at("test.array-journal"), "journal");
    EXPECT_EQ(codeOf([&] { makeArray(); }), Wire::ErrorCode::AlreadyExists);
    EXPECT_EQ(filesInDirectory(), std::vector<std::string>{"test.array-journal"});
}

TEST_F(MakingAnArrayFile, replacesAnArrayFileWhenToldTo) {
    auto const path = makeArray();
    makeArrayFile(other(), path, Replace::ArrayFile);
    EXPECT_EQ(ArrayFile(path).inventory().arrays[0].id, "other");
    EXPECT_EQ(filesInDirectory(), std::vector<std::string>{"test.array"});
}

TEST_F(MakingAnArrayFile, makesAFileWhereThereIsNoneToReplace) {
    makeArrayFile(other(), at("new.array"), Replace::ArrayFile);
    EXPECT_EQ(ArrayFile(at("new.array")).counts().arrays, 1);
}

TEST_F(MakingAnArrayFile, fault_51_replacesNothingThatIsNoArrayFileOfThisVersion) {
    writeBytes(at("text"), "precious, and longer than the header of a database, which is a hundred bytes long or so, I "
                           "believe");
    Stranger(makeArray("newer")).execute("PRAGMA user_version = 2");
    Stranger(makeArray("foreign")).execute("PRAGMA application_id = 7");
    for (auto const &[name, code] :
         {std::pair("text", Wire::ErrorCode::FileMalformed), std::pair("newer", Wire::ErrorCode::FileNewer),
          std::pair("foreign", Wire::ErrorCode::FileForeign)}) {
        auto const path = at(name);
        auto const before = bytesOf(path);
        EXPECT_EQ(codeOf([&] { makeArrayFile(other(), path, Replace::ArrayFile); }), code) << name;
        EXPECT_NE(failureOf([&] { ArrayFile file(path); }).find(path), std::string::npos);
        EXPECT_EQ(bytesOf(path), before) << name;
    }
    EXPECT_EQ(filesInDirectory(), (std::vector<std::string>{"foreign", "newer", "text"}));
}

TEST_F(MakingAnArrayFile, tellsWhyAFileCannotBeMade) {
    auto const path = at("no/such/directory/x.array");
    EXPECT_EQ(failureOf([&] { makeArrayFile(other(), path, Replace::Never); }),
              "the array file '" + path + "' cannot be made: No such file or directory");
    EXPECT_EQ(codeOf([&] { makeArrayFile(other(), path, Replace::Never); }), Wire::ErrorCode::FileMissing);
    std::filesystem::create_directory(at("directory"));
    EXPECT_NE(codeOf([&] { makeArrayFile(other(), at("directory"), Replace::ArrayFile); }), Wire::ErrorCode::Success);
    EXPECT_TRUE(std::filesystem::is_directory(at("directory")));
}

TEST_F(MakingAnArrayFile, takesAwayAbandonedDraftsAndNothingElse) {
    std::string const uuid = "10000000-0000-4000-8000-000000000001";
    std::vector<std::string> const kept = {
        "Test.array." + uuid + ".new",                         // of another file
        "test.array-" + uuid + ".new",                         // all but a dot
        "test.array." + uuid + ".old",                         // another ending
        "test.array.10000000-0000-4000-8000-00000000000x.new", // no id
        "test.array.20000000-0000-4000-8000-000000000002.new", // a file
        "test.array.30000000-0000-4000-8000-000000000003.new", // held by its maker
    };
    for (std::size_t number = 0; number < kept.size(); ++number) {
        if (number == 4) {
            writeBytes(at(kept[number]), "x");
        } else {
            std::filesystem::create_directory(at(kept[number]));
        }
    }
    Wire::UniqueFd const maker(::open(at(kept.back()).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    ASSERT_EQ(::flock(maker.get(), LOCK_EX | LOCK_NB), 0);
    auto const abandoned = at("test.array." + uuid + ".new");
    std::filesystem::create_directory(abandoned);
    writeBytes(abandoned + "/array", "half");
    makeArray();
    EXPECT_FALSE(std::filesystem::exists(abandoned));
    std::vector<std::string> expected = kept;
    expected.push_back("test.array");
    std::sort(expected.begin(), expected.end());
    EXPECT_EQ(filesInDirectory(), expected);
}

TEST_F(MakingAnArrayFile, takesANameWithoutADirectoryAsOneOfTheWorkingDirectory) {
    auto const before = std::filesystem::current_path();
    std::filesystem::current_path(directory_);
    makeArrayFile(other(), "x.array", Replace::Never);
    std::filesystem::current_path(before);
    EXPECT_EQ(filesInDirectory(), std::vector<std::string>{"x.array"});
    EXPECT_EQ(ArrayFile(at("x.array")).inventory().arrays, other().arrays);
}

TEST_F(MakingAnArrayFile, needsNoRightToReadItsDirectory) {
    std::filesystem::create_directory(at("open"));
    std::filesystem::create_directory(at("closed"));
    ASSERT_EQ(::chmod(directory_.c_str(), 0711), 0);
    ASSERT_EQ(::chmod(at("open").c_str(), 0333), 0); // to be entered and written, not read
    ASSERT_EQ(::chmod(at("closed").c_str(), 0555), 0);
    // Root may do everything; become somebody else for a while.
    bool const root = ::geteuid() == 0;
    ASSERT_TRUE(!root || ::seteuid(65534) == 0);
    auto const first = failureOf([&] { makeArrayFile(other(), at("open/x.array"), Replace::Never); });
    auto const second = failureOf([&] { makeArrayFile(other(), at("closed/x.array"), Replace::Never); });
    ASSERT_TRUE(!root || ::seteuid(0) == 0);
    EXPECT_EQ(first, "");
    EXPECT_EQ(second, "the array file '" + at("closed/x.array") + "' cannot be made: Permission denied");
    ASSERT_EQ(::chmod(at("open").c_str(), 0755), 0);
    EXPECT_EQ(ArrayFile(at("open/x.array")).inventory().arrays[0].id, "other");
}

TEST_F(MakingAnArrayFile, saysWhatTheSystemSaidOfANameThatIsTooLong) {
    auto const path = at(std::string(250, 'x'));
    EXPECT_EQ(failureOf([&] { makeArrayFile(other(), path, Replace::Never); }),
              "the array file '" + path + "' cannot be made: File name too long");
    EXPECT_EQ(codeOf([&] { makeArrayFile(other(), path, Replace::Never); }), Wire::ErrorCode::IoError);
}

TEST_F(MakingAnArrayFile, readsEverySampleTopology) {
    for (std::string const name : {"small", "two-providers/a", "two-providers/b"}) {
        auto const source = std::string(TOVI_LAB) + "/topologies/" + name + ".json";
        auto const topology = parseTopology(bytesOf(source), source);
        EXPECT_FALSE(topology.containers.empty());
        auto const path = at(std::filesystem::path(name).filename());
        makeArrayFile(topology, path, Replace::Never);
        ArrayFile(path).checkIntegrity();
    }
}

TEST_F(MakingAnArrayFile, letsTwoProvidersShareAnArrayAndNoContainer) {
    auto const read = [](std::string const &name) {
        return parseTopology(bytesOf(std::string(TOVI_LAB) + "/topologies/two-providers/" + name), name);
    };
    auto const a = read("a.json");
    auto const b = read("b.json");
    EXPECT_EQ(a.arrays[0], b.arrays[0]);
    EXPECT_NE(a.arrays[1].id, b.arrays[1].id);
    for (auto const &container : a.containers) {
        for (auto const &counterpart : b.containers) {
            EXPECT_NE(container.id, counterpart.id);
            EXPECT_NE(container.name, counterpart.name);
        }
    }
}
