// SPDX-License-Identifier: Apache-2.0
//
// A host with an array file and a daemon in a process of its own, for tests that have many threads ask it at once.
#pragma once

#include <atomic>
#include <cstdlib>
#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "Program.h"
#include "lumolib/Client.h"
#include "store/HostStore.h"

namespace ThreadsTest {

/// Threads that begin together. What one of them throws fails the test.
class Crowd {
public:
    ~Crowd() {
        finish();
    }
    /// @param work is given the thread's number, from 0
    void add(int count, std::function<void(int)> const &work);
    /// Lets all begin that were added.
    void begin();
    /// Waits for the end of all, which begin now if they have not.
    void finish();

private:
    std::atomic<bool> begun_{false};
    std::vector<std::thread> threads_;
};

class Host : public testing::Test {
protected:
    static constexpr char const *gold = "3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001";

    /// A root whose provider "lab" serves the sample array; nothing is running yet.
    Host();
    ~Host() override;

    void startDaemon();
    /// Tells it to end. @return its exit status
    int stopDaemon();
    /// How many threads the daemon has now.
    std::size_t threadsOfDaemon() const;

    LumoClient::Settings settings() const;
    std::string const &root() const {
        return root_;
    }
    Store::Provider lab() const {
        return {"lab", "file://" + root_ + "/small.array", "", {}};
    }
    /// What a call fails with, as "code: sentence"; empty when it does not.
    static std::string failureOf(std::function<void()> const &call);

private:
    std::string root_;
    std::unique_ptr<LumodTest::Program> daemon_;
};

} // namespace ThreadsTest
