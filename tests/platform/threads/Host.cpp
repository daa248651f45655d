// SPDX-License-Identifier: Apache-2.0
#include "Host.h"

#include <csignal>
#include <filesystem>
#include <stdexcept>

namespace ThreadsTest {

namespace fs = std::filesystem;

void Crowd::add(int count, std::function<void(int)> const &work) {
    for (int number = 0; number < count; ++number) {
        threads_.emplace_back([this, work, number] {
            begun_.wait(false);
            try {
                work(number);
            } catch (std::exception const &failure) {
                ADD_FAILURE() << "thread " << number << ": " << failure.what();
            }
        });
    }
}

void Crowd::begin() {
    begun_ = true;
    begun_.notify_all();
}

void Crowd::finish() {
    begin();
    for (std::thread &thread : threads_) {
        thread.join();
    }
    threads_.clear();
}

Host::Host() {
    root_ = (fs::temp_directory_path() / "tovi-threads-XXXXXX").string();
    if (mkdtemp(root_.data()) == nullptr) {
        throw std::runtime_error("no temporary directory");
    }
    LumodTest::Program orkasim(TEST_PROGRAMS "/orkasim", {"make", TEST_TOPOLOGY, root_ + "/small.array"});
    if (LumodTest::Ended const made = orkasim.wait(); made.status != 0) {
        throw std::runtime_error(made.err);
    }
    Store::HostStore(root_, Store::HostStore::Mode::ReadWrite).putProviders({lab()});
}

Host::~Host() {
    daemon_.reset();
    fs::remove_all(root_);
}

void Host::startDaemon() {
    daemon_ = std::make_unique<LumodTest::Program>(TEST_PROGRAMS "/lumod", std::vector<std::string>{"--root", root_});
    ASSERT_EQ(daemon_->firstLine(), "lumod: ready at " + root_ + "/run/lumod.sock");
}

int Host::stopDaemon() {
    daemon_->signal(SIGTERM);
    int const status = daemon_->wait().status;
    daemon_.reset();
    return status;
}

std::size_t Host::threadsOfDaemon() const {
    return static_cast<std::size_t>(std::distance(
        fs::directory_iterator("/proc/" + std::to_string(daemon_->pid()) + "/task"), fs::directory_iterator()));
}

LumoClient::Settings Host::settings() const {
    LumoClient::Settings settings;
    settings.root = root_;
    return settings;
}

std::string Host::failureOf(std::function<void()> const &call) {
    try {
        call();
    } catch (Wire::Failure const &failure) {
        return std::to_string(static_cast<int>(failure.code())) + ": " + failure.sentence();
    }
    return {};
}

} // namespace ThreadsTest
