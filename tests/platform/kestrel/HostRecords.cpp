// SPDX-License-Identifier: Apache-2.0
//
// Provider records, the Orka context, endpoint events, and joining texts.
#include "Fixture.h"

#include <fstream>

#include "kestrel/Util.h"

namespace {

using Gantry::Storage::VendorProviderInfo;
using Kestrel::Storage::LumoFileSystemImpl;

using HostRecordsTest = KestrelTest;

TEST_F(HostRecordsTest, ProvidersComeBackAsTheyWerePut) {
    EXPECT_FALSE(host_->LumoVpExists("vp"));
    VendorProviderInfo const record{"vp", "file:///x", "aux", {{"a2", true, 7}, {"a1", false, -1}}};
    host_->UpdateLumoVendorProvider({record});
    EXPECT_TRUE(host_->LumoVpExists("vp"));
    std::vector<VendorProviderInfo> records(1);
    host_->GetLumoVendorProviders("vp", records);
    ASSERT_EQ(records.size(), 2U) << "appends";
    EXPECT_EQ(records[1].url, "file:///x");
    EXPECT_EQ(records[1].auxText, "aux");
    ASSERT_EQ(records[1].arrays.size(), 2U);
    EXPECT_EQ(records[1].arrays[0].arrayId, "a2");
    EXPECT_FALSE(records[1].arrays[1].isActive);
    EXPECT_EQ(records[1].arrays[1].priority, -1);
    host_->GetLumoVendorProviders("unknown", records);
    EXPECT_EQ(records.size(), 2U);
}

TEST_F(HostRecordsTest, ProvidersNeedNoDaemon) {
    daemon_.reset();
    host_->UpdateLumoVendorProvider({{"vp", "", "", {}}});
    EXPECT_TRUE(host_->LumoVpExists("vp"));
    LumoFileSystemImpl::UnRegisterVendorProvider("vp");
    EXPECT_FALSE(host_->LumoVpExists("vp"));
}

TEST_F(HostRecordsTest, UnregisteringAnUnknownProviderIsRefused) {
    EXPECT_EQ(messageOf([] { LumoFileSystemImpl::UnRegisterVendorProvider("nobody"); }),
              "no Orka provider named 'nobody' is registered on this host");
    EXPECT_EQ(messageOf([] { LumoFileSystemImpl::UnRegisterVendorProvider(""); }),
              "no Orka provider named '' is registered on this host");
    EXPECT_FALSE(exists(at("host.db")));
}

TEST_F(HostRecordsTest, TheOrkaContextIsSetAndCleared) {
    LumoFileSystemImpl::ClearOrkaContext();
    LumoFileSystemImpl::SetOrkaContext("As Typed");
    EXPECT_EQ(stored().orkaContext(), "As Typed");
    LumoFileSystemImpl::ClearOrkaContext();
    EXPECT_FALSE(stored().orkaContext());
}

TEST_F(HostRecordsTest, fault_51_AForeignStoreIsRefusedByEveryOperation) {
    writeFile(at("host.db"), "somebody's notes");
    for (auto const &message :
         {messageOf([&] { host_->LumoVpExists("x"); }), messageOf([&] { host_->GetLumoFileSystems(); }), messageOf([&] {
              host_->UpdateLumoVendorProvider({{"vp", "", "", {}}});
          }),
          messageOf([&] { LumoFileSystemImpl::SetOrkaContext("x"); }), messageOf([&] { mountGold(); })}) {
        EXPECT_NE(message.find("the host store '" + at("host.db") + "' is damaged"), std::string::npos) << message;
    }
    EXPECT_EQ(readFile(at("host.db")), "somebody's notes");
    EXPECT_TRUE(treeOf(at("volumes")).empty());
}

TEST_F(HostRecordsTest, AnEndpointEventIsToldAndKept) {
    daemon_->addEndpoint("pe-7", {"gold", "silver"});
    std::vector<std::string> containers{"old"};
    host_->NotifyLumoProtocolEndpointEvent("pe-7", Gantry::Storage::ApdStart, containers);
    EXPECT_EQ(containers, (std::vector<std::string>{"gold", "silver"}));
    EXPECT_EQ(stored().endpointOutages(), std::vector<std::string>{"pe-7"});
    host_->NotifyLumoProtocolEndpointEvent("pe-7", Gantry::Storage::ApdEnd, containers);
    EXPECT_TRUE(stored().endpointOutages().empty());
    EXPECT_EQ(daemon_->takeRequests(), (std::vector<std::string>{"apd pe-7 start", "apd pe-7 end"}));
}

TEST_F(HostRecordsTest, AnUnknownEndpointIsRefusedAndNotKept) {
    std::vector<std::string> containers;
    for (auto const event : {Gantry::Storage::ApdStart, Gantry::Storage::ApdEnd}) {
        EXPECT_EQ(messageOf([&] { host_->NotifyLumoProtocolEndpointEvent("pe-0", event, containers); }),
                  "no array has the protocol endpoint pe-0");
    }
    EXPECT_FALSE(exists(at("host.db")));
}

TEST_F(HostRecordsTest, TheOutageOfAnEndpointThatIsGoneCanBeEnded) {
    Store::HostStore(root_, Store::HostStore::Mode::ReadWrite).setEndpointOutage("pe-0", true);
    std::vector<std::string> containers{"old"};
    host_->NotifyLumoProtocolEndpointEvent("pe-0", Gantry::Storage::ApdEnd, containers);
    EXPECT_TRUE(containers.empty());
    EXPECT_TRUE(stored().endpointOutages().empty());
}

TEST_F(HostRecordsTest, WithoutTheDaemonAnEndpointEventIsNotKept) {
    daemon_.reset();
    std::vector<std::string> containers;
    EXPECT_NE(messageOf([&] {
                  host_->NotifyLumoProtocolEndpointEvent("pe-7", Gantry::Storage::ApdStart, containers);
              }).find(at("run/lumod.sock")),
              std::string::npos);
    EXPECT_TRUE(stored().endpointOutages().empty());
}

TEST(VectorToString, JoinsWithTheSeparatorBetweenNeighbours) {
    using Kestrel::Util::VectorToString;
    EXPECT_EQ(VectorToString({}, ","), "");
    EXPECT_EQ(VectorToString({"a"}, ","), "a");
    EXPECT_EQ(VectorToString({"a", "", "b"}, ", "), "a, , b");
    EXPECT_EQ(VectorToString({"", ""}, ","), ",");
    EXPECT_EQ(VectorToString({"a", "b"}, ""), "ab");
}

} // namespace
