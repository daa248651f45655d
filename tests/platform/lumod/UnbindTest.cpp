// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>

#include "Fixture.h"

namespace {

using namespace LumodTest;
using testing::HasSubstr;
using Wire::ErrorCode;

class UnbindTest : public DaemonFixture {
protected:
    UnbindTest()
        : vendor_(addUsualVendor())
        , uuid_(addBound("vm")) {}

    std::string addBound(std::string const &name) {
        std::string const uuid = vendor_->addVolume(containerIdOf(1), name);
        vendor_->volumes.at(uuid).boundTo = "e1";
        return uuid;
    }
    bool isBound(std::string const &uuid) {
        return vendor_->volumes.at(uuid).boundTo.has_value();
    }
    static Fill period(int64_t microseconds) {
        return [microseconds](Wire::Request::Builder request) {
            request.initDebugCommand().setUnbindPeriodUs(microseconds);
        };
    }

    std::shared_ptr<FakeVendor> vendor_;
    std::string uuid_;
};

TEST_F(UnbindTest, TakesPlaceWhenThePeriodHasPassed) {
    Reply const reply = volumeRequest("unbind", uuid_);
    EXPECT_STREQ(reply.only().getVolume().getEndpoint().cStr(), "e1") << "it is still bound";
    advance(5 * kj::MINUTES - 1 * kj::SECONDS);
    EXPECT_TRUE(isBound(uuid_));
    advance(1 * kj::SECONDS);
    EXPECT_FALSE(isBound(uuid_));
    EXPECT_TRUE(sink_.holds("unbind-timer unbound the virtual volume " + uuid_));
}

TEST_F(UnbindTest, TakesPlaceAtOnceWithPeriodZero) {
    std::string const other = addBound("other");
    std::string const mounted = addBound("mounted");
    volumeRequest("unbind", uuid_);
    volumeRequest("unbind", other);
    EXPECT_EQ(ask(period(0)).code(), ErrorCode::Success);
    EXPECT_FALSE(isBound(uuid_));
    EXPECT_FALSE(isBound(other));
    EXPECT_TRUE(isBound(mounted)) << "nobody asked for it";
    volumeRequest("unbind", mounted);
    EXPECT_TRUE(isBound(mounted)) << "zero is for now, not for ever";
}

TEST_F(UnbindTest, APeriodPastTheEndOfTheClockIsRefused) {
    volumeRequest("unbind", uuid_);
    int64_t const year = int64_t{365} * 24 * 3600 * 1000 * 1000;
    for (int64_t const tooLong : {INT64_MAX, year + 1}) {
        Reply const refused = ask([tooLong](Wire::Request::Builder request) {
            request.initDebugCommand().setLogLevel(64);
            request.getDebugCommand().setUnbindPeriodUs(tooLong);
        });
        EXPECT_EQ(refused.code(), ErrorCode::InvalidArgument);
    }
    EXPECT_FALSE(sink_.holds("the log level is trivia")) << "what is refused changes nothing";
    EXPECT_EQ(ask(period(year)).code(), ErrorCode::Success);
    advance(6 * kj::MINUTES);
    EXPECT_TRUE(isBound(uuid_));
}

TEST_F(UnbindTest, APeriodCountsForThoseThatWaitAlready) {
    volumeRequest("unbind", uuid_);
    advance(2 * kj::SECONDS);
    EXPECT_TRUE(isBound(uuid_));
    ask(period(3'000'000));
    advance(500 * kj::MILLISECONDS);
    EXPECT_TRUE(isBound(uuid_));
    advance(500 * kj::MILLISECONDS);
    EXPECT_FALSE(isBound(uuid_));
}

TEST_F(UnbindTest, AVolumeThatIsBoundAgainIsLeftAlone) {
    volumeRequest("unbind", uuid_);
    volumeRequest("bind", uuid_);
    advance(6 * kj::MINUTES);
    EXPECT_TRUE(isBound(uuid_));
    EXPECT_EQ(vendor_->count("unbindVirtualVolume"), 0);
}

TEST_F(UnbindTest, BindingWaitsForAnUnbindingThatIsUnderWay) {
    volumeRequest("unbind", uuid_);
    vendor_->hanging.insert("unbindVirtualVolume");
    advance(5 * kj::MINUTES);
    Pending binding = start(volumeFill("bind", uuid_));
    EXPECT_FALSE(binding.promise.poll(scope_));
    vendor_->answer();
    EXPECT_EQ(finish(kj::mv(binding)).code(), ErrorCode::Success);
    EXPECT_TRUE(isBound(uuid_));
    EXPECT_EQ(vendor_->count("bindVirtualVolume"), 1);
}

TEST_F(UnbindTest, OneThatFailsIsTriedAgainAfterAnotherPeriod) {
    volumeRequest("unbind", uuid_);
    vendor_->failing.emplace("unbindVirtualVolume", Wire::Failure(ErrorCode::ProviderUnreachable, "the wire is cut"));
    advance(5 * kj::MINUTES);
    EXPECT_TRUE(isBound(uuid_));
    EXPECT_TRUE(sink_.holds("was not unbound: the wire is cut"));
    vendor_->failing.clear();
    advance(5 * kj::MINUTES);
    EXPECT_FALSE(isBound(uuid_));
}

TEST_F(UnbindTest, AFailureOfUnbindingNowIsTold) {
    volumeRequest("unbind", uuid_);
    vendor_->failing.emplace("unbindVirtualVolume", Wire::Failure(ErrorCode::ProviderUnreachable, "the wire is cut"));
    EXPECT_EQ(ask(period(0)).sentence(), "the wire is cut");
    EXPECT_TRUE(isBound(uuid_));
}

TEST_F(UnbindTest, AnUnboundVolumeDoesNotWait) {
    vendor_->volumes.at(uuid_).boundTo.reset();
    EXPECT_EQ(volumeRequest("unbind", uuid_).code(), ErrorCode::Success);
    advance(6 * kj::MINUTES);
    EXPECT_EQ(vendor_->count("unbindVirtualVolume"), 0);
}

TEST_F(UnbindTest, AnUnknownVolumeIsNamed) {
    Reply const reply = volumeRequest("unbind", "", "other");
    EXPECT_EQ(reply.code(), ErrorCode::NoSuchVolume);
    EXPECT_THAT(reply.sentence(), HasSubstr("'other'"));
}

TEST_F(UnbindTest, ADeletedVolumeWaitsNoLonger) {
    volumeRequest("unbind", uuid_);
    volumeRequest("delete", uuid_);
    advance(6 * kj::MINUTES);
    EXPECT_EQ(vendor_->count("unbindVirtualVolume"), 1) << "only the deletion's own";
}

TEST_F(UnbindTest, OneThatVanishedIsForgotten) {
    volumeRequest("unbind", uuid_);
    vendor_->volumes.clear();
    EXPECT_EQ(ask(period(0)).code(), ErrorCode::Success);
    vendor_->calls.clear();
    advance(6 * kj::MINUTES);
    EXPECT_TRUE(vendor_->calls.empty());
}

} // namespace
