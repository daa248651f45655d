// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

#include <cstdio>
#include <filesystem>

#include <kj/async.h>
#include <kj/timer.h>

#include "orka/ProviderFactory.h"

using namespace Orka;

namespace {

/// An event loop whose clock stands still until the test moves it.
class EmbeddedProviderTest : public OrkaTest {
protected:
    // KJ's destructors may throw; gtest's fixtures may not.
    ~EmbeddedProviderTest() noexcept override = default;

    ProviderSurroundings surroundings() {
        return {timer_, [this] { return newUuid_(); }};
    }
    std::unique_ptr<Provider> provider(std::string const &name = "test.array") {
        return makeProvider("file://" + at(name), surroundings());
    }
    CallContext within(kj::Duration time, std::string key = "") {
        return {timer_.now() + time, std::nullopt, std::move(key)};
    }
    CallContext soon() {
        return within(1 * kj::SECONDS);
    }
    void advance(kj::Duration time) {
        // In small steps, as a running clock would, so that every pause ends where it was to end.
        auto const end = timer_.now() + time;
        while (timer_.now() < end) {
            timer_.advanceTo(timer_.now() + 1 * kj::MILLISECONDS);
            scope_.poll();
        }
    }
    template <typename T>
    T get(kj::Promise<Outcome<T>> promise) {
        return promise.wait(scope_).value();
    }
    template <typename T>
    Wire::ErrorCode failing(kj::Promise<Outcome<T>> promise) {
        auto const outcome = promise.wait(scope_);
        return outcome.ok() ? Wire::ErrorCode::Success : outcome.failure().code();
    }
    static VolumeSpec spec(std::string const &directoryName) {
        VolumeSpec made;
        made.containerId = goldId;
        made.directoryName = directoryName;
        return made;
    }

    kj::EventLoop loop_;
    kj::WaitScope scope_{loop_};
    kj::TimerImpl timer_{kj::origin<kj::TimePoint>()};
    std::function<std::string()> newUuid_ = countingUuids();
};

TEST_F(EmbeddedProviderTest, performsEveryOperation) {
    makeArray();
    auto const array = provider();
    EXPECT_EQ(get(array->queryStorageArray(soon())).items->size(), 2U);
    EXPECT_EQ(get(array->queryStorageContainer(soon())).items->size(), 2U);
    auto const made = get(array->createVirtualVolume(soon(), spec("vm")));
    EXPECT_EQ(get(array->queryVirtualVolume(soon(), goldId, made.uuid)), made);
    get(array->bindVirtualVolume(soon(), goldId, made.uuid, "pe-1"));
    EXPECT_EQ(get(array->queryVirtualVolumesBound(soon())).size(), 2U);
    auto const presence = get(array->queryVirtualVolumesById(soon(), goldId, {made.uuid, noVolume}));
    EXPECT_EQ(presence, (std::vector<VolumePresence>{{true, "pe-1"}, {false, std::nullopt}}));
    EXPECT_EQ(get(array->queryVirtualVolumeByDirectoryName(soon(), goldId, "vm"))->uuid, made.uuid);
    EXPECT_EQ(get(array->queryVirtualVolumesOfContainer(soon(), goldId, 100)).size(), 3U);
    EXPECT_EQ(get(array->spaceStatsForVirtualVolume(soon(), goldId, made.uuid)), (SpaceStats{4096, 0, 0}));
    EXPECT_EQ(get(array->unsharedChunksVirtualVolume(soon(), goldId, made.uuid)).bitmap.size(), 512U);
    EXPECT_EQ(get(array->getMetadata(soon(), goldId, made.uuid)), (Metadata{{"directoryName", "vm"}}));
    get(array->unbindVirtualVolume(soon(), goldId, made.uuid));
    get(array->deleteVirtualVolume(soon(), goldId, made.uuid));
    EXPECT_EQ(failing(array->queryVirtualVolume(soon(), goldId, made.uuid)), Wire::ErrorCode::NoSuchVolume);
}

TEST_F(EmbeddedProviderTest, tellsTheArrayOnWhoseBehalfTheHostSpeaks) {
    makeArray();
    auto const array = provider();
    auto context = soon();
    context.orkaContext = "nexa";
    get(array->setContext(context));
    EXPECT_EQ(ArrayFile(at("test.array")).hostContext(), "nexa");
    get(array->setContext(soon()));
    EXPECT_EQ(ArrayFile(at("test.array")).hostContext(), std::nullopt);
}

TEST_F(EmbeddedProviderTest, performsAMutationOnceAKey) {
    makeArray();
    auto const array = provider();
    auto const first = get(array->createVirtualVolume(within(1 * kj::SECONDS, "key"), spec("vm")));
    EXPECT_EQ(get(array->createVirtualVolume(within(1 * kj::SECONDS, "key"), spec("vm"))), first);
    EXPECT_EQ(get(array->queryVirtualVolumesOfContainer(soon(), goldId, 100)).size(), 3U);
}

TEST_F(EmbeddedProviderTest, waitsForALockWithoutHoldingUpTheLoop) {
    makeArray();
    auto const array = provider();
    Stranger stranger(at("test.array"));
    stranger.execute("BEGIN EXCLUSIVE");
    auto promise = array->queryStorageContainer(soon());
    EXPECT_FALSE(promise.poll(scope_));
    auto other = kj::evalLater([] { return 7; });
    EXPECT_TRUE(other.poll(scope_));
    advance(500 * kj::MILLISECONDS);
    EXPECT_FALSE(promise.poll(scope_));
    stranger.execute("ROLLBACK");
    advance(50 * kj::MILLISECONDS);
    ASSERT_TRUE(promise.poll(scope_));
    EXPECT_EQ(get(kj::mv(promise)).items->size(), 2U);
}

TEST_F(EmbeddedProviderTest, isBusyAtTheDeadlineAndNotBefore) {
    makeArray();
    auto const array = provider();
    Stranger stranger(at("test.array"));
    stranger.execute("BEGIN EXCLUSIVE");
    auto promise = array->createVirtualVolume(within(200 * kj::MILLISECONDS), spec("vm"));
    advance(199 * kj::MILLISECONDS);
    EXPECT_FALSE(promise.poll(scope_));
    advance(1 * kj::MILLISECONDS);
    ASSERT_TRUE(promise.poll(scope_));
    auto const outcome = promise.wait(scope_);
    ASSERT_FALSE(outcome.ok());
    EXPECT_EQ(outcome.failure().code(), Wire::ErrorCode::ProviderBusy);
    EXPECT_EQ(outcome.failure().sentence(),
              "the array file '" + at("test.array") + "' is busy: another process held its lock until the deadline");
    stranger.execute("ROLLBACK");
    EXPECT_EQ(get(array->queryVirtualVolumesOfContainer(soon(), goldId, 100)).size(), 2U);
}

TEST_F(EmbeddedProviderTest, readsBesideAWriterAndWritesAfterIt) {
    makeArray();
    auto const array = provider();
    Stranger stranger(at("test.array"));
    stranger.execute("BEGIN IMMEDIATE");
    auto creation = array->createVirtualVolume(soon(), spec("vm"));
    EXPECT_FALSE(creation.poll(scope_));
    EXPECT_EQ(get(array->queryVirtualVolumesOfContainer(soon(), goldId, 100)).size(), 2U);
    stranger.execute("COMMIT");
    advance(50 * kj::MILLISECONDS);
    ASSERT_TRUE(creation.poll(scope_));
    EXPECT_EQ(get(kj::mv(creation)).directoryName, "vm");
}

TEST_F(EmbeddedProviderTest, retriesACommitThatAReaderHoldsUp) {
    makeArray();
    auto const array = provider();
    Stranger stranger(at("test.array"));
    stranger.execute("BEGIN; SELECT count(*) FROM volume");
    auto creation = array->createVirtualVolume(soon(), spec("vm"));
    EXPECT_FALSE(creation.poll(scope_));
    stranger.execute("COMMIT");
    advance(50 * kj::MILLISECONDS);
    ASSERT_TRUE(creation.poll(scope_));
    EXPECT_EQ(get(kj::mv(creation)).directoryName, "vm");
    EXPECT_EQ(ArrayFile(at("test.array")).counts().configVolumes, 3);
}

TEST_F(EmbeddedProviderTest, beginsNothingAfterTheDeadline) {
    makeArray();
    auto const array = provider();
    EXPECT_EQ(failing(array->createVirtualVolume(within(0 * kj::SECONDS), spec("vm"))),
              Wire::ErrorCode::DeadlineExceeded);
    EXPECT_EQ(ArrayFile(at("test.array")).counts().configVolumes, 2);
}

TEST_F(EmbeddedProviderTest, doesNothingWhenThePromiseIsDropped) {
    makeArray();
    auto const array = provider();
    { auto dropped = array->createVirtualVolume(soon(), spec("at once")); }
    Stranger stranger(at("test.array"));
    stranger.execute("BEGIN EXCLUSIVE");
    {
        auto dropped = array->createVirtualVolume(soon(), spec("while it waits"));
        EXPECT_FALSE(dropped.poll(scope_));
    }
    stranger.execute("ROLLBACK");
    advance(1 * kj::SECONDS);
    EXPECT_EQ(ArrayFile(at("test.array")).counts().configVolumes, 2);
}

TEST_F(EmbeddedProviderTest, finishesWhatIsPendingWhenItIsDestroyed) {
    makeArray();
    auto array = provider();
    Stranger stranger(at("test.array"));
    stranger.execute("BEGIN EXCLUSIVE");
    auto promise = array->queryStorageArray(soon());
    EXPECT_FALSE(promise.poll(scope_));
    auto notBegun = array->queryStorageContainer(soon());
    array.reset();
    stranger.execute("ROLLBACK");
    advance(50 * kj::MILLISECONDS);
    EXPECT_EQ(get(kj::mv(promise)).items->size(), 2U);
    EXPECT_EQ(get(kj::mv(notBegun)).items->size(), 2U);
}

TEST_F(EmbeddedProviderTest, recoversWhenTheFileAppears) {
    auto const array = provider();
    for (int round = 0; round < 2; ++round) {
        auto const outcome = array->queryStorageArray(soon()).wait(scope_);
        ASSERT_FALSE(outcome.ok());
        EXPECT_EQ(outcome.failure().code(), Wire::ErrorCode::FileMissing);
        EXPECT_EQ(outcome.failure().sentence(), "the array file '" + at("test.array") + "' does not exist");
    }
    EXPECT_TRUE(filesInDirectory().empty());
    makeArray();
    EXPECT_EQ(get(array->queryStorageArray(soon())).items->size(), 2U);
}

TEST_F(EmbeddedProviderTest, fault_51_refusesAFileThatIsNoArrayFileOfThisVersionAndRecovers) {
    Stranger(makeArray("newer")).execute("PRAGMA user_version = 2");
    Stranger(makeArray("foreign")).execute("PRAGMA application_id = 7");
    writeBytes(at("garbage"), std::string(5000, 'x'));
    makeArray("good");
    auto const array = provider();
    for (auto const &[name, code] :
         {std::pair("newer", Wire::ErrorCode::FileNewer), std::pair("foreign", Wire::ErrorCode::FileForeign),
          std::pair("garbage", Wire::ErrorCode::FileMalformed)}) {
        writeBytes(at("test.array"), bytesOf(at(name)));
        auto const outcome = array->createVirtualVolume(soon(), spec("vm")).wait(scope_);
        ASSERT_FALSE(outcome.ok());
        EXPECT_EQ(outcome.failure().code(), code);
        EXPECT_NE(outcome.failure().sentence().find(at("test.array")), std::string::npos);
        EXPECT_EQ(bytesOf(at("test.array")), bytesOf(at(name)));
    }
    writeBytes(at("test.array"), bytesOf(at("good")));
    EXPECT_EQ(get(array->createVirtualVolume(soon(), spec("vm"))).directoryName, "vm");
}

TEST_F(EmbeddedProviderTest, fault_48_namesADamagedFileAndOverwritesNothing) {
    makeArray();
    auto bytes = bytesOf(at("test.array"));
    auto const array = provider();
    // Every page but the first one, whose header would make it no database at all.
    for (size_t index = 4096; index < bytes.size(); ++index) {
        bytes[index] = static_cast<char>(~bytes[index]);
    }
    writeBytes(at("test.array"), bytes);
    auto const outcome = array->createVirtualVolume(soon(), spec("vm")).wait(scope_);
    ASSERT_FALSE(outcome.ok());
    EXPECT_EQ(outcome.failure().code(), Wire::ErrorCode::FileMalformed);
    EXPECT_NE(outcome.failure().sentence().find(at("test.array")), std::string::npos);
    EXPECT_EQ(bytesOf(at("test.array")), bytes);
}

TEST_F(EmbeddedProviderTest, noticesThatTheFileIsGoneAndMakesNoNewOne) {
    makeArray();
    auto const array = provider();
    get(array->queryStorageArray(soon()));
    std::filesystem::remove(at("test.array"));
    EXPECT_EQ(failing(array->queryStorageArray(soon())), Wire::ErrorCode::FileMissing);
    EXPECT_EQ(failing(array->createVirtualVolume(soon(), spec("vm"))), Wire::ErrorCode::FileMissing);
    EXPECT_TRUE(filesInDirectory().empty());
}

TEST_F(EmbeddedProviderTest, servesTheFileThatReplacedTheFirstOne) {
    makeArray();
    auto const array = provider();
    auto const before = get(array->queryStorageArray(soon()));
    makeArrayFile(parseTopology(R"({"arrays": [{"id": "new"}]})", "new"), at("test.array"), Replace::ArrayFile);
    auto const after = get(array->queryStorageArray(soon()));
    EXPECT_NE(after.version, before.version);
    ASSERT_EQ(after.items->size(), 1U);
    EXPECT_EQ(after.items->front().id, "new");
    EXPECT_EQ(before.items->size(), 2U);
}

TEST_F(EmbeddedProviderTest, mutatesTheNewFileWhenItIsReplacedInTheMiddle) {
    makeArray();
    makeArray("next.array");
    auto const array = provider();
    bool replaced = false;
    newUuid_ = [&, next = countingUuids()]() mutable {
        if (!replaced) {
            replaced = true;
            std::filesystem::rename(at("next.array"), at("test.array"));
        }
        return next();
    };
    auto const made = get(array->createVirtualVolume(soon(), spec("vm")));
    EXPECT_TRUE(replaced);
    EXPECT_TRUE(ArrayFile(at("test.array")).presence(goldId, {made.uuid})[0].exists);
    EXPECT_EQ(filesInDirectory(), std::vector<std::string>{"test.array"});
}

TEST_F(EmbeddedProviderTest, handsOutOneListUntilAnotherProcessCommits) {
    makeArray();
    auto const array = provider();
    auto const first = get(array->queryStorageContainer(soon()));
    get(array->createVirtualVolume(soon(), spec("vm")));
    auto const second = get(array->queryStorageContainer(soon()));
    EXPECT_EQ(second.items, first.items);
    EXPECT_EQ(second.version, first.version);
    EXPECT_EQ(get(array->queryStorageArray(soon())).version, first.version);
    Stranger(at("test.array")).execute("UPDATE container SET name = 'platinum' WHERE name = 'gold'");
    auto const third = get(array->queryStorageContainer(soon()));
    EXPECT_NE(third.version, first.version);
    EXPECT_EQ(third.items->front().name, "platinum");
    EXPECT_EQ(first.items->front().name, "gold");
}

struct Url {
    char const *url;
    char const *sentence;
};

TEST_F(EmbeddedProviderTest, refusesUrlsThatItCannotUse) {
    for (auto const &[url, sentence] : {
             Url{"https://host/orka", "the provider URL 'https://host/orka' cannot be used: providers are reached by "
                                      "file:///path/name.array"},
             Url{"", "the provider URL '' cannot be used: providers are reached by file:///path/name.array"},
             Url{"/path", "the provider URL '/path' cannot be used: providers are reached by file:///path/name.array"},
             Url{"file://", "the provider URL 'file://' cannot be used: an array file is named by its whole path, as "
                            "in file:///path/name.array"},
             Url{"file://host/x", "the provider URL 'file://host/x' cannot be used: an array file is named by its "
                                  "whole path, as in file:///path/name.array"},
             Url{"file:///a%00b",
                 "the provider URL 'file:///a%00b' cannot be used: a path cannot hold the character NUL"},
         }) {
        EXPECT_EQ(failureOf([&, &u = url] { makeProvider(u, surroundings()); }), sentence);
        EXPECT_EQ(codeOf([&, &u = url] { makeProvider(u, surroundings()); }), Wire::ErrorCode::InvalidArgument);
    }
}

TEST_F(EmbeddedProviderTest, findsTheFileHoweverItsUrlIsSpelled) {
    makeArray("my array%4x.array");
    for (auto const &url : {"file://" + at("my array%4x.array"), "FILE://localhost" + at("my%20array%254x%2earray"),
                            "file://" + at("my%20array%4x.array")}) {
        auto const array = makeProvider(url, surroundings());
        EXPECT_EQ(failing(array->queryStorageArray(soon())), Wire::ErrorCode::Success) << url;
    }
}

} // namespace
