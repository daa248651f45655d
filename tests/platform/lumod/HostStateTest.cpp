// SPDX-License-Identifier: Apache-2.0
#include <fstream>

#include <gmock/gmock.h>
#include <sqlite3.h>

#include "Fixture.h"

namespace {

using namespace LumodTest;
using testing::ElementsAre;
using testing::HasSubstr;
using Wire::ErrorCode;

/// Another process's handle on the store.
class Intruder {
public:
    explicit Intruder(std::string const &path) {
        EXPECT_EQ(sqlite3_open(path.c_str(), &handle_), SQLITE_OK);
    }
    ~Intruder() {
        sqlite3_close(handle_);
    }
    Intruder(Intruder const &) = delete;
    Intruder &operator=(Intruder const &) = delete;
    void run(char const *sql) {
        char *message = nullptr;
        EXPECT_EQ(sqlite3_exec(handle_, sql, nullptr, nullptr, &message), SQLITE_OK) << message;
        sqlite3_free(message);
    }

private:
    sqlite3 *handle_ = nullptr;
};

class HostStateTest : public DaemonFixture {
protected:
    static void getAll(Wire::Request::Builder request) {
        request.setGetStorageContainer();
    }
};

TEST_F(HostStateTest, WhileTheStoreIsLockedTheLastKnownStateCounts) {
    addUsualVendor();
    EXPECT_THAT(containers(), ElementsAre("gold@fake:vp[a1]"));
    Intruder intruder(store_.path());
    intruder.run("BEGIN EXCLUSIVE");
    EXPECT_THAT(containers(), ElementsAre("gold@fake:vp[a1]"));
    intruder.run("ROLLBACK");
}

TEST_F(HostStateTest, WithoutAnyKnownStateARequestTriesAgainUntilTheLockIsGone) {
    addUsualVendor();
    Intruder intruder(store_.path());
    intruder.run("BEGIN EXCLUSIVE");
    Pending pending = start(getAll);
    EXPECT_FALSE(pending.promise.poll(scope_));
    EXPECT_STREQ(ask([](Wire::Request::Builder request) { request.setPing(); }).only().getPong().getVersion().cStr(),
                 "1.2.3")
        << "the event loop does not wait for the lock";
    advance(100 * kj::MILLISECONDS);
    EXPECT_FALSE(pending.promise.poll(scope_));
    intruder.run("ROLLBACK");
    advance(100 * kj::MILLISECONDS);
    EXPECT_THAT(containersIn(finish(kj::mv(pending))), ElementsAre("gold@fake:vp[a1]"));
}

TEST_F(HostStateTest, TheDeadlineEndsTheTrying) {
    addUsualVendor();
    Intruder intruder(store_.path());
    intruder.run("BEGIN EXCLUSIVE");
    Pending pending = start(getAll);
    for (int second = 0; second <= 31; ++second) {
        advance(1 * kj::SECONDS);
    }
    EXPECT_EQ(finish(kj::mv(pending)).code(), ErrorCode::FileBusy);
    intruder.run("ROLLBACK");
}

TEST_F(HostStateTest, AMalformedStoreIsToldWithItsPathAndTheDaemonLivesOn) {
    std::ofstream(store_.path()) << "this is no database, and long enough to be seen as something else than nothing at "
                                    "all, which an empty file would be";
    Reply const reply = ask(getAll);
    EXPECT_TRUE(reply.code() == ErrorCode::FileMalformed || reply.code() == ErrorCode::FileForeign);
    EXPECT_THAT(reply.sentence(), HasSubstr(store_.path()));
    EXPECT_TRUE(sink_.holds("error trace-1 "));
    EXPECT_EQ(ask([](Wire::Request::Builder request) { request.setPing(); }).code(), ErrorCode::Success);
}

TEST_F(HostStateTest, AForeignOrNewerStoreIsRefused) {
    addUsualVendor();
    {
        Intruder intruder(store_.path());
        intruder.run("PRAGMA user_version = 99");
    }
    EXPECT_EQ(ask(getAll).code(), ErrorCode::FileNewer);
    {
        Intruder intruder(store_.path());
        intruder.run("PRAGMA application_id = 77");
    }
    EXPECT_EQ(ask(getAll).code(), ErrorCode::FileForeign);
}

TEST_F(HostStateTest, TheSameTroubleIsLoggedOnce) {
    std::ofstream(store_.path()) << "this is no database, and long enough to be seen as something else than nothing";
    ask(getAll);
    ask(getAll);
    std::size_t const first = sink_.text.find(store_.path());
    EXPECT_EQ(sink_.text.find(store_.path(), first + 1), std::string::npos);
}

} // namespace
