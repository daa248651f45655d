// SPDX-License-Identifier: Apache-2.0
#include "VendorProviderSet.h"

#include "CommandTest.h"

using namespace PluginTest;
using TarselCli::LumoNamespace::VendorProviderSet;

namespace {

class ProviderSet : public CommandTest {
protected:
    ProviderSet() {
        input->SetString("vp-name", "north");
        kestrel.lumoVpExists.always(true);
        kestrel.getLumoVendorProviders.always({{"north", "https://registered", "aux", {{"old", true, 9}}}});
    }
    void giveOneArray() {
        input->SetStringList("arrayid", {"a1"});
        input->SetIntList("priority", {5});
        input->SetBoolList("isactive", {false});
    }
    std::vector<std::string> updates() const {
        return callsOf("StorageInfoImpl.UpdateLumoVendorProvider");
    }
};

TEST_F(ProviderSet, ReplacesTheArraysAndKeepsTheRegisteredUrl) {
    giveOneArray();
    run<VendorProviderSet>();
    expectResultAlone("\"Successfully Updated VP with name : north\\n\"");
    EXPECT_THAT(ranCalls,
                ElementsAre("StorageInfoImpl()", "Input.GetString(\"vp-name\")",
                            "StorageInfoImpl.LumoVpExists(\"north\")", "Input.GetStringList(\"arrayid\")",
                            "Input.GetIntList(\"priority\")", "Input.GetBoolList(\"isactive\")",
                            "StorageInfoImpl.GetLumoVendorProviders(\"north\", [])",
                            "StorageInfoImpl.UpdateLumoVendorProvider([\"north\" at \"https://registered\" aux \"\" "
                            "arrays {\"a1\" passive 5}])",
                            "Output.SetResult(\"Successfully Updated VP with name : north\\n\")", "Output.Complete()",
                            "~StorageInfoImpl()"));
}

TEST_F(ProviderSet, WithoutArraysClearsThemAndWritesOnce) {
    run<VendorProviderSet>();
    expectResultAlone("\"Successfully Updated VP with name : north\\n\"");
    EXPECT_THAT(updates(), ElementsAre("StorageInfoImpl.UpdateLumoVendorProvider([\"north\" at \"https://registered\" "
                                       "aux \"\" arrays {}])"));
}

TEST_F(ProviderSet, TakesTheUrlOfTheFirstRecord) {
    kestrel.getLumoVendorProviders.once({{"north", "first", "", {}}, {"north", "second", "", {}}});
    run<VendorProviderSet>();
    EXPECT_THAT(updates(),
                ElementsAre("StorageInfoImpl.UpdateLumoVendorProvider([\"north\" at \"first\" aux \"\" arrays {}])"));
}

TEST_F(ProviderSet, RefusesAnUnknownNameBeforeReadingTheLists) {
    kestrel.lumoVpExists.once(false);
    giveOneArray();
    run<VendorProviderSet>();
    expectMessageAlone("Cannot Update VP as : north does not exist\n");
    EXPECT_THAT(ranCalls, ElementsAre("StorageInfoImpl()", "Input.GetString(\"vp-name\")",
                                      "StorageInfoImpl.LumoVpExists(\"north\")",
                                      "Output.SetMessage(\"Cannot Update VP as : north does not exist\\n\")",
                                      "~StorageInfoImpl()"));
}

TEST_F(ProviderSet, RefusesAnEmptyNameLikeAnUnknownOne) {
    kestrel.lumoVpExists.once(false);
    input->SetString("vp-name", "");
    run<VendorProviderSet>();
    expectMessageAlone("Cannot Update VP as :  does not exist\n");
    EXPECT_THAT(callsOf("StorageInfoImpl."), ElementsAre("StorageInfoImpl.LumoVpExists(\"\")"));
}

TEST_F(ProviderSet, RefusesListsOfDifferentLength) {
    input->SetStringList("arrayid", {"a1", "a2"});
    input->SetIntList("priority", {1, 2});
    input->SetBoolList("isactive", {true});
    run<VendorProviderSet>();
    expectMessageAlone("Missing one of the  parameter arrayIdor priority or isActive for an Array ");
    EXPECT_THAT(callsOf("StorageInfoImpl."), ElementsAre("StorageInfoImpl.LumoVpExists(\"north\")"));
}

TEST_F(ProviderSet, KeepsTheLow32BitsOfAPriority) {
    input->SetStringList("arrayid", {"a", "b"});
    input->SetIntList("priority", {-1, int64_t{1} << 31});
    input->SetBoolList("isactive", {true, false});
    run<VendorProviderSet>();
    EXPECT_THAT(updates(), ElementsAre("StorageInfoImpl.UpdateLumoVendorProvider([\"north\" at \"https://registered\" "
                                       "aux \"\" arrays {\"a\" active -1, \"b\" passive -2147483648}])"));
}

TEST_F(ProviderSet, ReportsAFailedReadWithNothingBetweenTextAndCause) {
    kestrel.getLumoVendorProviders.throwOnce(gantryFailure("cannot read"));
    run<VendorProviderSet>();
    expectMessageAlone("Failed to update VPcannot read");
    EXPECT_THAT(updates(), IsEmpty());
}

TEST_F(ProviderSet, ReportsAFailedWrite) {
    kestrel.updateLumoVendorProvider.throwOnce(gantryFailure(": disk full"));
    run<VendorProviderSet>();
    expectMessageAlone("Failed to update VP: disk full");
}

TEST_F(ProviderSet, ReportsAFailureWhileTheResultIsSet) {
    output->onSetResult.throwOnce(gantryFailure(" no room"));
    run<VendorProviderSet>();
    expectMessageAlone("Failed to update VP no room");
}

TEST_F(ProviderSet, ReportsAFailureWhileTheOutputCompletes) {
    output->onComplete.throwOnce(gantryFailure(" no room"));
    run<VendorProviderSet>();
    expectMessageBehindResult("Failed to update VP no room", "\"Successfully Updated VP with name : north\\n\"");
}

TEST_F(ProviderSet, ReportsANameThatExistsWithoutARecordAndWritesNothing) {
    kestrel.getLumoVendorProviders.once({});
    run<VendorProviderSet>();
    expectMessageAlone("Failed to update VP: the host has no record of north");
    EXPECT_THAT(updates(), IsEmpty());
}

TEST_F(ProviderSet, LetsAFailedExistenceCheckPass) {
    kestrel.lumoVpExists.throwOnce(gantryFailure("no store"));
    EXPECT_THROW(run<VendorProviderSet>(), Gantry::Lib::GantryException);
    EXPECT_FALSE(output->HasMessage());
}

TEST_F(ProviderSet, LetsAnUnexpectedExceptionPass) {
    kestrel.getLumoVendorProviders.throwOnce(Unexpected("surprise"));
    EXPECT_THROW(run<VendorProviderSet>(), Unexpected);
    EXPECT_FALSE(output->HasMessage());
}

} // namespace
