// SPDX-License-Identifier: Apache-2.0
#include <sstream>

#include <gmock/gmock.h>
#include <rapidjson/document.h>

#include "Fixture.h"

namespace {

using namespace LumodTest;
using testing::HasSubstr;
using Wire::ErrorCode;

class DebugCommandTest : public DaemonFixture {
protected:
    Reply logLevel(int64_t level) {
        return ask([level](Wire::Request::Builder request) { request.initDebugCommand().setLogLevel(level); });
    }
    /// The objects that a dump wrote, as "object: one member".
    std::vector<std::string> dump() {
        sink_.text.clear();
        ask([](Wire::Request::Builder request) { request.initDebugCommand().setDump(1); });
        std::vector<std::string> objects;
        std::istringstream lines(sink_.text);
        for (std::string line; std::getline(lines, line);) {
            std::size_t const place = line.find(" trace-1 dump ");
            if (place != std::string::npos) {
                rapidjson::Document document;
                document.Parse(line.c_str() + place + 14);
                EXPECT_FALSE(document.HasParseError()) << line;
                objects.emplace_back(document["object"].GetString());
                last_[objects.back()] = line.substr(place + 14);
            }
        }
        return objects;
    }
    std::map<std::string, std::string> last_;
};

TEST_F(DebugCommandTest, TheLogLevelChangesWhatIsLogged) {
    addUsualVendor();
    sink_.text.clear();
    containers();
    EXPECT_FALSE(sink_.holds("queryStorageArray"));
    logLevel(64);
    containers();
    EXPECT_TRUE(sink_.holds("trivia trace-1 queryStorageArray of provider 'vp'"));
    logLevel(4);
    sink_.text.clear();
    inject("vp", "offline");
    EXPECT_EQ(sink_.text, "");
}

TEST_F(DebugCommandTest, ANumberThatIsNoLevelChangesNothing) {
    Reply const reply = logLevel(3);
    EXPECT_EQ(reply.code(), ErrorCode::InvalidArgument);
    EXPECT_EQ(log_.level(), Lumod::LogLevel::Info);
}

TEST_F(DebugCommandTest, ACommandWithoutSettingsChangesNothing) {
    EXPECT_TRUE(ask([](Wire::Request::Builder request) { request.initDebugCommand(); }).only().isDone());
    EXPECT_EQ(log_.level(), Lumod::LogLevel::Info);
    EXPECT_EQ(daemon_->core().unbindTimer.period(), 5 * kj::MINUTES);
}

TEST_F(DebugCommandTest, TheDumpHoldsEveryObjectWhateverTheLevel) {
    auto const vendor = addUsualVendor();
    addVendor("other", {{"a7", true, 4}});
    std::string const uuid = vendor->addVolume(containerIdOf(1), "vm");
    vendor->volumes.at(uuid).boundTo = "e1";
    volumeRequest("unbind", uuid);
    inject("vp", "online");
    store_.setEndpointOutage("e2", true);
    ask([](Wire::Request::Builder request) {
        auto activation = request.initActivateProvider();
        activation.setArrayId("a1");
        activation.setProviderName("vp");
    });
    ask([](Wire::Request::Builder request) {
        auto rule = request.initAddFaultInjectionRule();
        rule.setFault("TIMEOUT");
        rule.setOperation("*");
        rule.setFrequency(9);
    });
    logLevel(1);
    EXPECT_THAT(dump(), testing::ElementsAre("daemon", "provider", "provider", "providerArray", "activation",
                                             "faultRule", "endpointOutage", "waitingUnbind"));
    EXPECT_THAT(last_["waitingUnbind"], HasSubstr(uuid));
    EXPECT_THAT(last_["faultRule"], HasSubstr(R"("fault":"TIMEOUT","operation":"*","frequency":9)"));
    EXPECT_THAT(last_["daemon"], HasSubstr(R"("logLevel":"quiet")"));
}

TEST_F(DebugCommandTest, HostileTextsStayInsideTheirJson) {
    store_.putProviders({{"a\"b\n\x1b", "fake:x", {}, {}}});
    ask([](Wire::Request::Builder request) { request.setGetStorageContainer(); });
    EXPECT_THAT(dump(), testing::ElementsAre("daemon", "provider"));
    EXPECT_EQ(sink_.text.find('\x1b'), std::string::npos);
}

} // namespace
