// SPDX-License-Identifier: Apache-2.0
//
// Writers that are killed in the middle.
#include "Fixture.h"

#include <csignal>
#include <cstdlib>
#include <filesystem>

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

using namespace Orka;

namespace {

class KilledWriters : public OrkaTest {
protected:
    KilledWriters() {
        // Leaks cannot be looked for in a program that is traced.
        char const *const given = getenv("ASAN_OPTIONS");
        setenv("ASAN_OPTIONS", ((given != nullptr ? std::string(given) + ':' : "") + "detect_leaks=0").c_str(), 1);
    }

    /// Runs a program to its end, silently. @return its wait status
    static int run(std::vector<std::string> words) {
        std::vector<char *> arguments;
        for (auto &word : words) {
            arguments.push_back(word.data());
        }
        arguments.push_back(nullptr);
        posix_spawn_file_actions_t actions;
        posix_spawn_file_actions_init(&actions);
        posix_spawn_file_actions_addopen(&actions, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
        posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, "/dev/null", O_WRONLY, 0);
        pid_t child = 0;
        int status = -1;
        if (posix_spawnp(&child, arguments[0], &actions, nullptr, arguments.data(), environ) == 0) {
            waitpid(child, &status, 0);
        }
        posix_spawn_file_actions_destroy(&actions);
        return status;
    }
};

/// Leaves a transaction half written to the file and its journal beside it.
void killInTheMiddleOfAWrite(std::string const &path) {
    pid_t const child = fork();
    if (child == 0) {
        Stranger stranger(path);
        // A cache of one page spills changed pages into the file before the commit.
        stranger.execute("PRAGMA cache_size = 1; BEGIN IMMEDIATE; DELETE FROM metadata; "
                         "UPDATE volume SET bound_to = NULL; UPDATE container SET name = 'lost'; "
                         "WITH RECURSIVE n(i) AS (VALUES (1) UNION ALL SELECT i + 1 FROM n WHERE i < 20000) "
                         "INSERT INTO answer (idempotency_key, request) SELECT 'k' || i, 'r' FROM n");
        raise(SIGKILL);
    }
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == SIGKILL);
}

} // namespace

TEST_F(KilledWriters, fault_52_leaveTheOldStateForTheNextReader) {
    auto const path = makeArray();
    auto const before = bytesOf(path);
    killInTheMiddleOfAWrite(path);
    ASSERT_NE(bytesOf(path), before);
    ASSERT_TRUE(std::filesystem::exists(path + "-journal"));
    ArrayFile file(path);
    EXPECT_EQ(file.counts(), (ArrayFileCounts{2, 6, 2, 2, 1, 1, 3}));
    EXPECT_EQ(file.inventory().containers[0].name, "gold");
    EXPECT_EQ(bytesOf(path), before);
    EXPECT_FALSE(std::filesystem::exists(path + "-journal"));
}

TEST_F(KilledWriters, leaveNoJournalThatAReplacementCouldTakeForItsOwn) {
    auto const path = makeArray();
    killInTheMiddleOfAWrite(path);
    ASSERT_TRUE(std::filesystem::exists(path + "-journal"));
    makeArrayFile(parseTopology(R"({"arrays": [{"id": "new"}]})", "new"), path, Replace::ArrayFile);
    EXPECT_FALSE(std::filesystem::exists(path + "-journal"));
    ArrayFile file(path);
    file.checkIntegrity();
    EXPECT_EQ(file.inventory().arrays[0].id, "new");
}

// orkasim is killed at its first, second, third... call of each kind, until it gets to its end.
TEST_F(KilledWriters, fault_27_makeANewFileWholeOrNotAtAll) {
    if (run({"strace", "-o", "/dev/null", "true"}) != 0) {
        GTEST_SKIP() << "strace cannot trace here";
    }
    writeBytes(at("old.json"), R"({"arrays": [{"id": "old"}]})");
    writeBytes(at("new.json"), sampleTopology());
    std::filesystem::create_directory(at("work"));
    auto const array = at("work/test.array");
    for (std::string const call :
         {"mkdir", "flock", "pwrite64", "fsync,fdatasync", "unlink", "rmdir", "rename", "link"}) {
        for (bool const replaces : {false, true}) {
            int kills = 0;
            for (int when = 1;; ++when) {
                std::filesystem::remove_all(at("work"));
                std::filesystem::create_directory(at("work"));
                if (replaces) {
                    ASSERT_EQ(run({TOVI_ORKASIM, "make", at("old.json"), array}), 0);
                }
                int const status = run({"strace", "-o", "/dev/null", "-e", "trace=" + call, "-e",
                                        "inject=" + call + ":signal=KILL:when=" + std::to_string(when), TOVI_ORKASIM,
                                        "make", "--force", at("new.json"), array});
                auto const where = call + " number " + std::to_string(when) + (replaces ? ", replacing" : "");
                if (!WIFSIGNALED(status)) {
                    ASSERT_EQ(status, 0) << where;
                    EXPECT_EQ(ArrayFile(array).counts().containers, 2) << where;
                    break;
                }
                ++kills;
                if (std::filesystem::exists(array)) {
                    ArrayFile file(array);
                    file.checkIntegrity();
                    auto const isOld = file.inventory().arrays[0].id == "old";
                    EXPECT_TRUE(isOld ? replaces : file.counts().configVolumes == 2) << where;
                } else {
                    EXPECT_FALSE(replaces) << where;
                }
                // Whatever lies around, the next attempt succeeds.
                ASSERT_EQ(run({TOVI_ORKASIM, "make", "--force", at("new.json"), array}), 0) << where;
                EXPECT_EQ(ArrayFile(array).counts().containers, 2) << where;
                // And what the killed one left beside it is gone.
                EXPECT_EQ(std::distance(std::filesystem::directory_iterator(at("work")), {}), 1) << where;
            }
            if (call == (replaces ? "rename" : "link")) {
                EXPECT_EQ(kills, 1);
            }
        }
    }
}
