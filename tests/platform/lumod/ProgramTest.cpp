// SPDX-License-Identifier: Apache-2.0
//
// The program itself, from its command line to its exit status, with real processes and signals. The pipe of its
// standard output tells when it is ready, and waiting for its end needs no clock.
#include <csignal>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>

#include <fcntl.h>
#include <sched.h>
#include <spawn.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gmock/gmock.h>

#include "Program.h"
#include "ServerFixture.h"
#include "orka/Topology.h"
#include "wire/Framing.h"
#include "wire/SocketAddress.h"

namespace {

using namespace LumodTest;
using testing::EndsWith;
using testing::HasSubstr;
using testing::StartsWith;

class ProgramTest : public testing::Test {
protected:
    class Program : public LumodTest::Program {
    public:
        Program(std::vector<std::string> const &arguments, std::vector<std::string> const &environment = {},
                std::vector<int> const &passed = {})
            : LumodTest::Program(LUMOD_PROGRAM, arguments, environment, passed) {}
    };
    static Ended run(std::vector<std::string> const &arguments, std::vector<std::string> const &environment = {}) {
        return Program(arguments, environment).wait();
    }
    std::vector<std::string> usual() const {
        return {"--root", root_.path()};
    }
    /// Asks the running daemon something and returns the first reply's bytes as a message reader's root.
    WireReply ask(Fill const &fill) const {
        Wire::UniqueFd const socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
        Wire::SocketAddress const address(paths_.orderedSocket());
        if (::connect(socket.get(), address.get(), address.size()) != 0) {
            return {};
        }
        capnp::MallocMessageBuilder message;
        auto request = message.initRoot<Wire::Request>();
        request.setVersion(Wire::PROTOCOL_VERSION);
        request.setId(1);
        request.setDeadlineMs(10000);
        fill(request);
        auto const deadline = std::chrono::steady_clock::now() + std::chrono::seconds(10);
        Wire::send(socket.get(), message, Wire::requestBytesMax, deadline);
        Wire::MessageBuffer buffer;
        if (!Wire::receive(socket.get(), buffer, Wire::replyBytesMax, deadline)) {
            return {};
        }
        capnp::SegmentArrayMessageReader reader(buffer.segments(), Wire::readerOptions(buffer.bodyBytes()));
        auto const reply = reader.getRoot<Wire::Reply>();
        return {reply.getId(), reply.getLast(), reply.which(), Wire::ErrorCode::Success, {}};
    }
    bool answers() const {
        return ask([](Wire::Request::Builder request) { request.setPing(); }).which == Wire::Reply::PONG;
    }
    std::string readLog() const {
        std::ostringstream text;
        text << std::ifstream(paths_.logFile()).rdbuf();
        return text.str();
    }

    TempDirectory root_;
    Wire::Paths paths_{root_.path()};
};

TEST_F(ProgramTest, WrongUsageExitsWithTwo) {
    std::vector<std::vector<std::string>> const wrong = {
        {"--bogus"},
        {"--root"},
        {"--log-level", "loud"},
        {"--unbind-period", "0"},
        {"--unbind-period", "12x"},
        {"stray"},
        {"--group", "no such group"},
        {"--root="},
    };
    for (std::vector<std::string> const &arguments : wrong) {
        Ended const ended = run(arguments);
        EXPECT_EQ(ended.status, 2) << arguments.front();
        EXPECT_THAT(ended.err, StartsWith("lumod: ")) << arguments.front();
        EXPECT_EQ(ended.out, "");
    }
    EXPECT_EQ(run({}, {"TOVI_LOG_LEVEL=loud"}).status, 2);
}

TEST_F(ProgramTest, HelpAndVersionAreToldOnStandardOutput) {
    Ended const help = run({"--help"});
    EXPECT_EQ(help.status, 0);
    EXPECT_THAT(help.out, HasSubstr("--unbind-period"));
    EXPECT_EQ(help.err, "");
    EXPECT_THAT(run({"--version"}).out, StartsWith("lumod "));
}

TEST_F(ProgramTest, ItSaysWhenItIsReadyAndCleansUpAtTheEnd) {
    for (int const signal : {SIGTERM, SIGINT}) {
        Program daemon(usual());
        EXPECT_EQ(daemon.firstLine(), "lumod: ready at " + paths_.orderedSocket());
        EXPECT_TRUE(answers());
        std::string pid;
        std::ifstream(paths_.pidFile()) >> pid;
        EXPECT_EQ(pid, std::to_string(daemon.pid()));
        daemon.signal(signal);
        EXPECT_EQ(daemon.wait().status, 0);
        EXPECT_FALSE(std::filesystem::exists(paths_.orderedSocket()));
        EXPECT_FALSE(std::filesystem::exists(paths_.prioritySocket()));
        EXPECT_FALSE(std::filesystem::exists(paths_.pidFile()));
    }
    EXPECT_THAT(readLog(), HasSubstr(" info - Ending: signal 15\n"));
}

TEST_F(ProgramTest, fault_29_ASecondDaemonExitsAndTheFirstGoesOn) {
    Program first(usual());
    first.firstLine();
    Ended const second = run(usual());
    EXPECT_EQ(second.status, 1);
    EXPECT_EQ(second.err, "lumod: another daemon (process " + std::to_string(first.pid()) + ") serves " + root_.path() +
                              " already: it holds the lock " + paths_.lockFile() + "\n");
    EXPECT_TRUE(answers());
}

TEST_F(ProgramTest, fault_28_AKilledDaemonsSocketsAreReplaced) {
    {
        Program killed(usual());
        killed.firstLine();
        killed.signal(SIGKILL);
        EXPECT_EQ(killed.wait().status, 128 + SIGKILL);
    }
    EXPECT_TRUE(std::filesystem::exists(paths_.orderedSocket()));
    EXPECT_FALSE(answers());
    Program next(usual());
    EXPECT_EQ(next.firstLine(), "lumod: ready at " + paths_.orderedSocket());
    EXPECT_TRUE(answers());
}

TEST_F(ProgramTest, HangupReopensTheLog) {
    Program daemon(usual());
    daemon.firstLine();
    std::string const moved = paths_.logFile() + ".1";
    std::filesystem::rename(paths_.logFile(), moved);
    daemon.signal(SIGHUP);
    daemon.signal(SIGTERM);
    EXPECT_EQ(daemon.wait().status, 0);
    EXPECT_THAT(readLog(), HasSubstr("Ended"));
}

TEST_F(ProgramTest, fault_6_ClosedStandardDescriptorsAreNotTakenForFiles) {
    std::string const command = std::string("exec ") + LUMOD_PROGRAM + " --root " + root_.path() + " <&- >&- 2>&-";
    pid_t pid = -1;
    std::vector<std::string> texts = {"/bin/sh", "-c", command};
    char *arguments[] = {texts[0].data(), texts[1].data(), texts[2].data(), nullptr};
    char *environment[] = {nullptr};
    ASSERT_EQ(::posix_spawn(&pid, "/bin/sh", nullptr, nullptr, arguments, environment), 0);
    auto const isUp = [this] { return answers(); };
    // Its output is closed, so that only its socket tells when it is ready.
    while (!isUp()) {
        ASSERT_EQ(::waitpid(pid, nullptr, WNOHANG), 0) << "it ended";
        ::sched_yield();
    }
    for (int descriptor = 0; descriptor < 3; ++descriptor) {
        EXPECT_EQ(std::filesystem::read_symlink("/proc/" + std::to_string(pid) + "/fd/" + std::to_string(descriptor)),
                  "/dev/null");
    }
    ::kill(pid, SIGTERM);
    int status = -1;
    ::waitpid(pid, &status, 0);
    EXPECT_EQ(status, 0);
}

TEST_F(ProgramTest, AServiceManagerPassesSocketsAndHearsWhenItIsReady) {
    std::filesystem::create_directory(paths_.run());
    std::vector<Wire::UniqueFd> sockets;
    std::vector<int> passed;
    for (std::string const &path : {paths_.orderedSocket(), paths_.prioritySocket()}) {
        sockets.emplace_back(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
        Wire::SocketAddress const address(path);
        ASSERT_EQ(::bind(sockets.back().get(), address.get(), address.size()), 0);
        ASSERT_EQ(::listen(sockets.back().get(), 16), 0);
        // Far above 3 and 4, where they are going to be.
        passed.push_back(::fcntl(sockets.back().get(), F_DUPFD_CLOEXEC, 50));
    }
    std::string const notifyPath = root_.path() + "/notify";
    Wire::UniqueFd const notify(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    Wire::SocketAddress const address(notifyPath);
    ASSERT_EQ(::bind(notify.get(), address.get(), address.size()), 0);
    Program daemon(usual(), {"LISTEN_FDS=2", "NOTIFY_SOCKET=" + notifyPath}, passed);
    daemon.firstLine();
    EXPECT_TRUE(answers());
    char text[64] = {};
    ::recv(notify.get(), text, sizeof text - 1, 0);
    EXPECT_STREQ(text, "READY=1");
    daemon.signal(SIGTERM);
    EXPECT_EQ(daemon.wait().status, 0);
    EXPECT_TRUE(std::filesystem::exists(paths_.orderedSocket())) << "the sockets are the service manager's";
    for (int const descriptor : passed) {
        ::close(descriptor);
    }
}

TEST_F(ProgramTest, ItServesARegisteredArrayFile) {
    Orka::Topology topology;
    topology.arrays = {arrayOf("a1", {"e1"})};
    topology.containers = {containerOf(1, "gold", {"a1"})};
    std::string const file = root_.path() + "/one.array";
    Orka::makeArrayFile(topology, file, Orka::Replace::Never);
    Store::HostStore(root_.path(), Store::HostStore::Mode::ReadWrite).putProviders({{"vp", "file://" + file, {}, {}}});
    Program daemon(usual());
    daemon.firstLine();
    EXPECT_EQ(ask([](Wire::Request::Builder request) { request.setGetStorageContainer(); }).which,
              Wire::Reply::STORAGE_ARRAYS);
    EXPECT_EQ(ask([](Wire::Request::Builder request) {
                  auto create = request.initCreateVirtualVolume();
                  create.setContainerId(containerIdOf(1).c_str());
                  create.setDirectoryName("vm");
              }).which,
              Wire::Reply::VOLUME);
}

} // namespace
