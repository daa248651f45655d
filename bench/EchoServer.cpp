// SPDX-License-Identifier: Apache-2.0
#include "EchoServer.h"

#include <arpa/inet.h>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <exception>
#include <map>
#include <memory>
#include <sys/epoll.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>
#include <utility>

namespace Bench {

namespace {

int listenAt(Address &at) {
    sockaddr_storage address{};
    socklen_t size = sizeof(sockaddr_in);
    if (at.isPath()) {
        auto &path = reinterpret_cast<sockaddr_un &>(address);
        path.sun_family = AF_UNIX;
        std::strncpy(path.sun_path, at.text.c_str(), sizeof(path.sun_path) - 1);
        size = sizeof(path);
    } else {
        auto &internet = reinterpret_cast<sockaddr_in &>(address);
        internet.sin_family = AF_INET;
        internet.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    }
    int const fd = socket(address.ss_family, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0);
    if (fd < 0 || bind(fd, reinterpret_cast<sockaddr const *>(&address), size) != 0 || listen(fd, 4096) != 0) {
        failWithErrno("cannot listen at " + at.text);
    }
    if (!at.isPath()) {
        sockaddr_in bound{};
        socklen_t boundSize = sizeof(bound);
        getsockname(fd, reinterpret_cast<sockaddr *>(&bound), &boundSize);
        at.text = "127.0.0.1:" + std::to_string(ntohs(bound.sin_port));
    }
    return fd;
}

class Echo {
public:
    Echo(int listener, TlsSettingsPtr tls, size_t requestBytes, size_t answerBytes)
        : listener_(listener)
        , tls_(std::move(tls))
        , requestBytes_(requestBytes)
        , answer_(answerBytes)
        , buffer_(size_t{64} << 10)
        , epoll_(epoll_create1(EPOLL_CLOEXEC)) {
        watch(listener_);
    }

    [[noreturn]] void run() {
        for (std::vector<epoll_event> events(1024);;) {
            int const ready = epoll_wait(epoll_, events.data(), static_cast<int>(events.size()), -1);
            for (int i = 0; i < ready; ++i) {
                int const fd = events[static_cast<size_t>(i)].data.fd;
                fd == listener_ ? accept() : answer(fd);
            }
        }
    }

private:
    struct Peer {
        std::unique_ptr<Channel> channel;
        size_t pending = 0;
    };

    void watch(int fd) const {
        epoll_event interest{};
        interest.events = EPOLLIN;
        interest.data.fd = fd;
        if (epoll_ctl(epoll_, EPOLL_CTL_ADD, fd, &interest) != 0) {
            failWithErrno("epoll");
        }
    }

    void accept() {
        for (int fd; (fd = accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK)) >= 0;) {
            peers_[fd] = {std::make_unique<Channel>(fd, tls_), 0};
            watch(fd);
        }
    }

    void answer(int fd) {
        Peer &peer = peers_.at(fd);
        while (size_t const got = peer.channel->receive(buffer_)) {
            for (peer.pending += got; peer.pending >= requestBytes_; peer.pending -= requestBytes_) {
                peer.channel->send(answer_);
            }
        }
        if (peer.channel->isOver()) {
            peers_.erase(fd);
        }
    }

    int listener_;
    TlsSettingsPtr tls_;
    size_t requestBytes_;
    std::vector<std::byte> answer_;
    std::vector<std::byte> buffer_;
    int epoll_;
    std::map<int, Peer> peers_;
};

} // namespace

EchoServer::EchoServer(Address const &at, TlsSettingsPtr const &tls, size_t requestBytes, size_t answerBytes)
    : address_(at) {
    int const listener = listenAt(address_);
    pid_t const parent = getpid();
    process_ = fork();
    if (process_ < 0) {
        failWithErrno("fork");
    }
    if (process_ == 0) {
        prctl(PR_SET_PDEATHSIG, SIGKILL);
        if (getppid() != parent) {
            _exit(1);
        }
        try {
            Echo(listener, tls, requestBytes, answerBytes).run();
        } catch (std::exception const &error) {
            std::fprintf(stderr, "echo server: %s\n", error.what());
        }
        _exit(1);
    }
    close(listener);
}

EchoServer::~EchoServer() {
    kill(process_, SIGKILL);
    waitpid(process_, nullptr, 0);
    if (address_.isPath()) {
        unlink(address_.text.c_str());
    }
}

} // namespace Bench
