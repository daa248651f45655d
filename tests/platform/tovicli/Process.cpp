// SPDX-License-Identifier: Apache-2.0
//
// What only the real process shows: descriptors, signals, exit status.
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <fcntl.h>
#include <functional>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/utsname.h>
#include <sys/wait.h>
#include <unistd.h>
#include <utility>
#include <vector>

#include "ProcessRun.h"

namespace {

using ::testing::StartsWith;

class Process : public ::testing::Test {
protected:
    /// Runs the tool with the test plug-in.
    int run(
        std::vector<std::string> words, std::function<void()> const &arrange = [] {}) {
        words.insert(words.begin(), {"--plugins", plugins.path()});
        return process.run(TEST_TOVICLI, words, arrange);
    }
    std::string output() {
        return process.output();
    }
    std::string errors() {
        return process.errors();
    }

    Process() {
        plugins.addPlugin("behaves", "behaves.so");
    }
    TemporaryDirectory plugins;
    ProcessRun process;
};

TEST_F(Process, RunsACommandOfAPlugin) {
    EXPECT_EQ(run({"storage", "sample", "answer"}), 0);
    EXPECT_EQ(output(), "42\n");
    EXPECT_EQ(errors(), "");
}

TEST_F(Process, LosesNothingThatAPluginPrintsByItself) {
    EXPECT_EQ(run({"storage", "sample", "print"}), 0);
    EXPECT_EQ(output(), "42\nprinted without the tool\n");
    EXPECT_EQ(errors(), "");
}

TEST_F(Process, fault_62_AnyAllocationMayFail) {
    if (std::string(TEST_FAILING_MALLOC).empty()) {
        GTEST_SKIP() << "the sanitizer's allocator cannot be replaced";
    }
    int failures = 0;
    int number = 1;
    for (int status = 1; status != 0 || number < 10;
         ++number) { // the first ones are the C++ library's, which can do without
        ASSERT_LT(number, 2000);
        status = process.run(TEST_TOVICLI, {"--version"}, [&number] {
            setenv("LD_PRELOAD", TEST_FAILING_MALLOC, 1);
            setenv("TEST_FAIL_ALLOCATION", std::to_string(number).c_str(), 1);
        });
        if (status != 0) {
            ASSERT_EQ(status, 1) << number;
            ASSERT_EQ(errors(), "tovicli: out of memory\n") << number;
            ++failures;
        }
    }
    EXPECT_GT(failures, 50);
}

TEST_F(Process, fault_6_ClosedDescriptorsAreOccupiedBeforeAnythingIsOpened) {
    auto const closeBoth = [] {
        close(STDIN_FILENO);
        close(STDOUT_FILENO);
    };
    EXPECT_EQ(run({"storage", "sample", "descriptor"}, closeBoth), 1);
    ASSERT_THAT(errors(), StartsWith("tovicli: next free descriptor "));
    EXPECT_GT(std::stoi(errors().substr(std::string("tovicli: next free descriptor ").size())), STDERR_FILENO);
}

TEST_F(Process, fault_6_ClosedOutputIsReported) {
    EXPECT_EQ(run({"storage", "sample", "answer"}, [] { close(STDOUT_FILENO); }), 4);
    EXPECT_EQ(errors(), "tovicli: cannot write the output: Bad file descriptor; the command itself was completed\n");
    EXPECT_EQ(run({"--version"},
                  [] {
                      close(STDIN_FILENO);
                      close(STDOUT_FILENO);
                      close(STDERR_FILENO);
                  }),
              4);
}

TEST_F(Process, fault_63_FullDeviceIsReported) {
    EXPECT_EQ(run({"storage", "sample", "answer"}, [] { dup2(open("/dev/full", O_WRONLY), STDOUT_FILENO); }), 4);
    EXPECT_EQ(errors(),
              "tovicli: cannot write the output: No space left on device; the command itself was completed\n");
}

TEST_F(Process, fault_63_ClosedPipeIsReportedNotASignal) {
    auto const closedPipe = [] {
        int ends[2] = {-1, -1};
        if (pipe(ends) == 0) {
            dup2(ends[1], STDOUT_FILENO);
            close(ends[0]);
            close(ends[1]);
        }
    };
    EXPECT_EQ(run({"storage", "sample", "answer"}, closedPipe), 4);
    EXPECT_EQ(errors(), "tovicli: cannot write the output: Broken pipe; the command itself was completed\n");
}

TEST_F(Process, InterruptEndsWith130) {
    EXPECT_EQ(run({"storage", "sample", "interrupt"}), 130);
    EXPECT_EQ(errors(), "tovicli: interrupted; part of the work may have been done\n");
}

TEST_F(Process, InterruptInAMachineFormatIsADocument) {
    EXPECT_EQ(run({"--format=json", "storage", "sample", "interrupt"}, [] { setenv("TOVI_REQUEST_ID", "r-1", 1); }),
              130);
    EXPECT_EQ(errors(), "{\"error\":{\"message\":\"interrupted; part of the work may have been done\",\"cause\":null,"
                        "\"code\":null,\"hint\":null,\"requestId\":\"r-1\",\"warnings\":[]}}\n");
    EXPECT_EQ(output(), "");
}

TEST_F(Process, InterruptThatWasIgnoredStaysIgnored) {
    EXPECT_EQ(run({"storage", "sample", "interrupt"}, [] { signal(SIGINT, SIG_IGN); }), 1);
    EXPECT_EQ(errors(), "tovicli: survived\n");
}

TEST_F(Process, fault_1_EmptyArgumentListIsHarmless) {
    pid_t const child = fork();
    if (child == 0) {
        char *nothing[] = {nullptr};
        dup2(open("/dev/null", O_WRONLY), STDOUT_FILENO);
        dup2(open("/dev/null", O_WRONLY), STDERR_FILENO);
        execv(TEST_TOVICLI, nothing);
        _exit(127);
    }
    int status = 0;
    waitpid(child, &status, 0);
    // Newer kernels put an empty name in, which asks for nothing and gets the help; older ones hand the empty list
    // over, which is a usage error.
    utsname kernel{};
    ASSERT_EQ(uname(&kernel), 0);
    std::pair<int, int> version;
    ASSERT_EQ(std::sscanf(kernel.release, "%d.%d", &version.first, &version.second), 2) << kernel.release;
    ASSERT_TRUE(WIFEXITED(status));
    EXPECT_EQ(WEXITSTATUS(status), version >= std::pair(5, 18) ? 0 : 2);
}

} // namespace
