// SPDX-License-Identifier: Apache-2.0
//
// A daemon's core on a fresh root with a host store, vendors in memory, a clock that a test advances and a log that it
// reads. Requests are built as a client builds them, and answers are read as a client reads them.
#pragma once

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <capnp/message.h>
#include <gtest/gtest.h>
#include <kj/timer.h>

#include "Core.h"
#include "Dispatch.h"
#include "FakeVendor.h"
#include "lumod/Daemon.h"
#include "store/HostStore.h"

namespace LumodTest {

class MemorySink : public Lumod::LogSink {
public:
    void write(std::string_view line) override {
        text += line;
    }
    bool holds(std::string_view part) const {
        return text.find(part) != std::string::npos;
    }
    std::string text;
};

class TempDirectory {
public:
    TempDirectory();
    ~TempDirectory();
    TempDirectory(TempDirectory const &) = delete;
    TempDirectory &operator=(TempDirectory const &) = delete;
    std::string const &path() const {
        return path_;
    }

private:
    std::string path_;
};

/// Everything that answered one request.
struct Reply {
    std::optional<Wire::Failure> failure;
    std::vector<std::unique_ptr<capnp::MallocMessageBuilder>> messages;

    Wire::Reply::Reader at(std::size_t index) const {
        return messages.at(index)->getRoot<Wire::Reply>().asReader();
    }
    Wire::Reply::Reader only() const {
        EXPECT_EQ(messages.size(), 1U);
        return at(0);
    }
    Wire::ErrorCode code() const {
        return failure ? failure->code() : Wire::ErrorCode::Success;
    }
    std::string sentence() const {
        return failure ? failure->sentence() : std::string();
    }
};

using Fill = std::function<void(Wire::Request::Builder)>;

/// A request that is under way.
struct Pending {
    std::unique_ptr<capnp::MallocMessageBuilder> request;
    kj::Promise<Lumod::Outcome<Lumod::ReplyPtr>> promise;
};

/// A well-formed container id that tells which one it is.
std::string containerIdOf(int number);
Orka::StorageArray arrayOf(std::string const &id, std::vector<std::string> const &endpoints);
Orka::StorageContainer containerOf(int number, std::string const &name, std::vector<std::string> const &arrayIds);

class DaemonFixture : public testing::Test {
protected:
    DaemonFixture();
    ~DaemonFixture() noexcept override;

    /// A vendor that is registered under its name with the URL fake:NAME.
    std::shared_ptr<FakeVendor> addVendor(std::string const &name, std::vector<Store::ProviderArray> arrays = {});
    /// A vendor "vp" with array "a1" (endpoints "e1" and "e2") that holds container 1, "gold".
    std::shared_ptr<FakeVendor> addUsualVendor();

    Pending start(Fill const &fill, bool ordered = true, std::string const &trace = "trace-1");
    /// Takes the answer, which must be there.
    Reply finish(Pending pending);
    Reply ask(Fill const &fill, bool ordered = true) {
        return finish(start(fill, ordered));
    }
    void advance(kj::Duration duration);

    /// Names and URLs of what getStorageContainer tells, as "name@url[array,array]".
    std::vector<std::string> containers();
    static std::vector<std::string> containersIn(Reply const &reply);

    Reply inject(std::string const &name, std::string const &status,
                 std::vector<std::pair<std::string, bool>> const &arrays = {});
    Reply volumeRequest(char const *method, std::string const &uuid, std::string const &directoryName = {},
                        bool ordered = true);
    static Fill volumeFill(char const *method, std::string const &uuid, std::string const &directoryName = {});
    std::vector<int> accessibility(std::vector<std::string> const &ids, int container = 1);

    TempDirectory root_;
    kj::EventLoop loop_;
    kj::WaitScope scope_{loop_};
    kj::TimerImpl timer_{kj::origin<kj::TimePoint>()};
    MemorySink sink_;
    Lumod::Log log_{sink_, Lumod::LogLevel::Info};
    std::map<std::string, std::shared_ptr<FakeVendor>> vendors_; ///< by URL
    Store::HostStore store_{root_.path(), Store::HostStore::Mode::ReadWrite};
    int keys_ = 0;
    std::unique_ptr<Lumod::Daemon> daemon_;
};

} // namespace LumodTest
