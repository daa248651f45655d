// SPDX-License-Identifier: Apache-2.0
#include <cstring>
#include <filesystem>
#include <fstream>
#include <thread>

#include <fcntl.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/un.h>
#include <unistd.h>

#include <gmock/gmock.h>

#include "ServerFixture.h"

namespace {

using namespace LumodTest;
using Wire::ErrorCode;

std::size_t openDescriptors() {
    return static_cast<std::size_t>(
        std::distance(std::filesystem::directory_iterator("/proc/self/fd"), std::filesystem::directory_iterator()));
}

class ServerTest : public ServerFixture {
protected:
    static void getAll(Wire::Request::Builder request) {
        request.setGetStorageContainer();
    }
    ErrorCode codeOfSecond() {
        try {
            Lumod::RunDirectory const second(paths_, std::nullopt);
        } catch (Wire::Failure const &failure) {
            sentence_ = failure.sentence();
            return failure.code();
        }
        return ErrorCode::Success;
    }
    std::string sentence_;
};

TEST_F(ServerTest, fault_22_DescriptorsThatAPeerAttachesAreNotKept) {
    RawClient client(orderedPath());
    ask(client, framed(ping));
    std::size_t const before = openDescriptors();
    std::string const request = framed(ping, 2);
    int const attached = ::open("/dev/null", O_RDONLY | O_CLOEXEC);
    alignas(cmsghdr) char control[CMSG_SPACE(sizeof(int))] = {};
    iovec content{const_cast<char *>(request.data()), request.size()};
    msghdr message{};
    message.msg_iov = &content;
    message.msg_iovlen = 1;
    message.msg_control = control;
    message.msg_controllen = sizeof control;
    cmsghdr *const header = CMSG_FIRSTHDR(&message);
    header->cmsg_level = SOL_SOCKET;
    header->cmsg_type = SCM_RIGHTS;
    header->cmsg_len = CMSG_LEN(sizeof attached);
    std::memcpy(CMSG_DATA(header), &attached, sizeof attached);
    EXPECT_EQ(::sendmsg(client.fd(), &message, MSG_NOSIGNAL), static_cast<ssize_t>(request.size()));
    ::close(attached);
    turn();
    EXPECT_EQ(parsed(*client.takeMessage()).id, 2U);
    EXPECT_EQ(openDescriptors(), before);
}

TEST_F(ServerTest, fault_28_AStaleSocketIsReplacedByTheLocksHolder) {
    server_.reset();
    // A killed daemon leaves its sockets and its pid file, and the kernel drops its lock.
    TempDirectory const other;
    Wire::Paths const paths(other.path());
    std::filesystem::create_directory(paths.run());
    {
        Wire::UniqueFd const stale(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        std::strcpy(address.sun_path, paths.orderedSocket().c_str());
        ASSERT_EQ(::bind(stale.get(), reinterpret_cast<sockaddr *>(&address), sizeof address), 0);
    }
    std::ofstream(paths.pidFile()) << "1\n";
    EXPECT_THROW(RawClient{paths.orderedSocket()}, std::runtime_error);
    Lumod::RunDirectory runDirectory(paths, std::nullopt);
    Wire::UniqueFd const socket = runDirectory.bindOrderedSocket();
    RawClient const client(paths.orderedSocket());
    struct stat status {};
    ASSERT_EQ(::stat(paths.orderedSocket().c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777, 0660U);
}

TEST_F(ServerTest, SomethingElseInTheSocketsPlaceIsLeftAlone) {
    TempDirectory const other;
    Wire::Paths const paths(other.path());
    std::filesystem::create_directory(paths.run());
    std::ofstream(paths.orderedSocket()) << "precious";
    Lumod::RunDirectory runDirectory(paths, std::nullopt);
    EXPECT_THROW(runDirectory.bindOrderedSocket(), Wire::Failure);
    EXPECT_EQ(std::filesystem::file_size(paths.orderedSocket()), 8U);
}

TEST_F(ServerTest, fault_29_ASecondDaemonLeavesTheFirstUndisturbed) {
    EXPECT_EQ(codeOfSecond(), ErrorCode::InUse);
    EXPECT_THAT(sentence_, testing::HasSubstr(paths_.lockFile()));
    EXPECT_THAT(sentence_, testing::HasSubstr(std::to_string(::getpid())));
    RawClient client(orderedPath());
    EXPECT_EQ(ask(client, framed(ping)).which, Wire::Reply::PONG);
    EXPECT_TRUE(std::filesystem::exists(paths_.pidFile()));
}

TEST_F(ServerTest, fault_58_ARootThatOthersCanChangeIsRefused) {
    TempDirectory const other;
    auto const sentenceFor = [&other] {
        try {
            Lumod::RunDirectory const refused(Wire::Paths(other.path()), std::nullopt);
        } catch (Wire::Failure const &failure) {
            EXPECT_EQ(failure.code(), ErrorCode::NotPermitted);
            return failure.sentence();
        }
        return std::string();
    };
    ASSERT_EQ(::chmod(other.path().c_str(), 01777), 0);
    EXPECT_EQ(sentenceFor(), "every user may write to the directory " + other.path() +
                                 " (mode 1777); the daemon needs one of its own");
    ASSERT_EQ(::chmod(other.path().c_str(), 0755), 0);
    if (::geteuid() == 0) {
        ASSERT_EQ(::chown(other.path().c_str(), 65534, static_cast<gid_t>(-1)), 0);
        EXPECT_EQ(sentenceFor(), "the directory " + other.path() +
                                     " belongs to user 65534, who is neither root nor the daemon's own user");
        ASSERT_EQ(::chown(other.path().c_str(), 0, static_cast<gid_t>(-1)), 0);
        std::filesystem::create_directory(other.path() + "/run");
        ASSERT_EQ(::chown((other.path() + "/run").c_str(), 65534, static_cast<gid_t>(-1)), 0);
        EXPECT_EQ(sentenceFor(), "the directory " + other.path() +
                                     "/run belongs to user 65534, who is neither root nor the daemon's own user");
        std::filesystem::remove(other.path() + "/run");
    }
    EXPECT_FALSE(std::filesystem::exists(other.path() + "/log"));
    EXPECT_EQ(sentenceFor(), "");
}

TEST_F(ServerTest, fault_57_DirectoriesAndSocketsAreForTheirUsersOnly) {
    TempDirectory const other;
    auto const modeOf = [](std::string const &path) {
        struct stat status {};
        EXPECT_EQ(::stat(path.c_str(), &status), 0) << path;
        return status.st_mode & 07777;
    };
    Wire::Paths const paths(other.path());
    {
        Lumod::RunDirectory runDirectory(paths, std::nullopt);
        Wire::UniqueFd const socket = runDirectory.bindPrioritySocket();
        EXPECT_EQ(modeOf(paths.run()), 0700U);
        EXPECT_EQ(modeOf(paths.logs()), 0700U);
        EXPECT_EQ(modeOf(paths.prioritySocket()), 0660U);
        EXPECT_EQ(modeOf(paths.lockFile()), 0600U);
    }
    Lumod::RunDirectory const forGroup(paths, ::getegid());
    EXPECT_EQ(modeOf(paths.run()), 0750U);
}

TEST_F(ServerTest, TheRunDirectoryCleansUpAfterItself) {
    server_.reset();
    runDirectory_.reset();
    EXPECT_FALSE(std::filesystem::exists(paths_.orderedSocket()));
    EXPECT_FALSE(std::filesystem::exists(paths_.prioritySocket()));
    EXPECT_FALSE(std::filesystem::exists(paths_.pidFile()));
    EXPECT_EQ(codeOfSecond(), ErrorCode::Success);
}

TEST_F(ServerTest, ARootWithALongNameIsServed) {
    std::string const root = root_.path() + "/" + std::string(150, 'r');
    Wire::Paths const paths(root);
    Lumod::RunDirectory runDirectory(paths, std::nullopt);
    Wire::UniqueFd const socket = runDirectory.bindOrderedSocket();
    RawClient const client(paths.orderedSocket());
}

TEST_F(ServerTest, fault_30_StoppingFinishesWhatIsUnderWay) {
    auto const vendor = addUsualVendor();
    vendor->hanging.insert("queryStorageArray");
    RawClient busy(orderedPath());
    RawClient idle(orderedPath());
    ask(idle, framed(ping));
    busy.send(framed(getAll, 7));
    turn();
    auto stopped = server_->stop();
    turn();
    EXPECT_TRUE(idle.isClosed());
    EXPECT_FALSE(busy.isClosed());
    EXPECT_FALSE(stopped.poll(io_.waitScope));
    vendor->answer();
    EXPECT_TRUE(stopped.poll(io_.waitScope));
    EXPECT_EQ(parsed(*busy.takeMessage()).which, Wire::Reply::STORAGE_ARRAYS);
    EXPECT_EQ(parsed(*busy.takeMessage()).which, Wire::Reply::STORAGE_CONTAINERS);
    EXPECT_TRUE(busy.isClosed());
}

TEST_F(ServerTest, fault_30_WhatDoesNotFinishIsGivenUpWithinFiveSeconds) {
    auto const vendor = addUsualVendor();
    vendor->hanging.insert("queryStorageArray");
    RawClient busy(orderedPath());
    busy.send(framed(getAll, 7));
    turn();
    auto stopped = server_->stop();
    advance(3 * kj::SECONDS);
    EXPECT_FALSE(stopped.poll(io_.waitScope));
    advance(1 * kj::SECONDS);
    WireReply const reply = parsed(*busy.takeMessage());
    EXPECT_EQ(reply.code, ErrorCode::ShuttingDown);
    EXPECT_TRUE(stopped.poll(io_.waitScope));
}

TEST_F(ServerTest, fault_30_APeerThatDoesNotReadDoesNotDelayTheEnd) {
    auto const vendor = addUsualVendor();
    for (int number = 2; number < 20000; ++number) {
        vendor->containers.push_back(containerOf(number, std::string(100, 'n'), {"a1"}));
    }
    RawClient lazy(orderedPath());
    lazy.send(framed(getAll));
    turn();
    auto stopped = server_->stop();
    advance(4 * kj::SECONDS);
    EXPECT_FALSE(stopped.poll(io_.waitScope));
    advance(999 * kj::MILLISECONDS);
    EXPECT_TRUE(stopped.poll(io_.waitScope));
}

TEST_F(ServerTest, fault_57_AnotherUserIsRefusedAndLogged) {
    if (::geteuid() != 0) {
        GTEST_SKIP() << "only root can connect as somebody else";
    }
    ::chmod(root_.path().c_str(), 0755);
    ::chmod(paths_.run().c_str(), 0755);
    ::chmod(orderedPath().c_str(), 0666);
    std::unique_ptr<RawClient> client;
    // The raw system call changes this thread's user alone, and the kernel notes who connects.
    std::thread([&] {
        ::syscall(SYS_setresuid, -1, 65534, -1);
        client = std::make_unique<RawClient>(orderedPath());
    }).join();
    client->send(framed(ping));
    turn();
    EXPECT_TRUE(client->isClosed());
    WireReply const words = parsed(client->takeMessage().value());
    EXPECT_EQ(words.id, 0U);
    EXPECT_EQ(words.code, ErrorCode::NotPermitted);
    EXPECT_EQ(words.sentence, "user 65534 may not use this daemon; it serves root");
    EXPECT_FALSE(client->takeMessage().has_value());
    EXPECT_TRUE(sink_.holds("refused a connection of user 65534"));
}

TEST_F(ServerTest, fault_60_AFloodingClientDoesNotKeepTheOthersOut) {
    rlimit limit{};
    ASSERT_EQ(::getrlimit(RLIMIT_NOFILE, &limit), 0);
    rlimit raised = limit;
    raised.rlim_cur = limit.rlim_max;
    ASSERT_EQ(::setrlimit(RLIMIT_NOFILE, &raised), 0);
    io_.waitScope.setBusyPollInterval(200);
    RawClient flooder(orderedPath());
    std::string flood;
    for (int request = 0; request < 2000; ++request) {
        flood += framed(ping, 1);
    }
    std::vector<std::unique_ptr<RawClient>> clients;
    for (int number = 0; number < 1000; ++number) {
        clients.push_back(std::make_unique<RawClient>(orderedPath()));
        clients.back()->send(framed(ping, 2));
    }
    int answered = 0;
    for (int round = 0; round < 50 && answered < 1000; ++round) {
        flooder.send(flood); // never reads: its answers fill the socket, and then nothing more is taken from it
        turn();
        answered = 0;
        for (auto const &client : clients) {
            answered += client->receive().empty() ? 0 : 1;
        }
    }
    EXPECT_EQ(answered, 1000);
    EXPECT_EQ(server_->connections(), 1001U);
    ::setrlimit(RLIMIT_NOFILE, &limit);
}

TEST_F(ServerTest, fault_62_WithoutDescriptorsItWaitsAndGoesOn) {
#ifdef SANITIZERS_NEED_DESCRIPTORS
    GTEST_SKIP()
        << "the undefined-behaviour sanitizer opens a pipe to look at an object and takes a refusal for a fault";
#endif
    RawClient first(orderedPath());
    ask(first, framed(ping));
    RawClient waiting(orderedPath());
    waiting.send(framed(ping, 2));
    rlimit limit{};
    ASSERT_EQ(::getrlimit(RLIMIT_NOFILE, &limit), 0);
    rlimit none = limit;
    none.rlim_cur = 3;
    ASSERT_EQ(::setrlimit(RLIMIT_NOFILE, &none), 0);
    turn();
    EXPECT_EQ(waiting.receive(), "");
    EXPECT_TRUE(sink_.holds("cannot take a connection"));
    EXPECT_EQ(ask(first, framed(ping, 3)).id, 3U) << "who is in is served";
    ASSERT_EQ(::setrlimit(RLIMIT_NOFILE, &limit), 0);
    advance(100 * kj::MILLISECONDS);
    EXPECT_EQ(parsed(*waiting.takeMessage()).id, 2U);
}

TEST_F(ServerTest, fault_62_ManyCallsLeaveNothingBehind) {
    RawClient client(orderedPath());
    ask(client, framed(ping));
    std::size_t const before = openDescriptors();
    for (int round = 0; round < 2000; ++round) {
        RawClient passing(orderedPath());
        passing.send(framed(ping));
        turn();
    }
    turn();
    EXPECT_EQ(openDescriptors(), before);
    EXPECT_EQ(server_->connections(), 1U);
}

TEST(Admission, AdmitsRootTheOwnUserAndTheGroup) {
    Lumod::Admission const admission{1000, 50};
    EXPECT_TRUE(admission.admits({0, 0, 1, {}}));
    EXPECT_TRUE(admission.admits({1000, 1000, 1, {}}));
    EXPECT_TRUE(admission.admits({1001, 50, 1, {}}));
    EXPECT_TRUE(admission.admits({1001, 1001, 1, {7, 50}}));
    EXPECT_FALSE(admission.admits({1001, 1001, 1, {7}}));
    EXPECT_FALSE((Lumod::Admission{1000, std::nullopt}.admits({1001, 50, 1, {50}})));
}

} // namespace
