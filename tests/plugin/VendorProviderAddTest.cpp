// SPDX-License-Identifier: Apache-2.0
#include "VendorProviderAdd.h"

#include "CommandTest.h"

using namespace PluginTest;
using TarselCli::LumoNamespace::VendorProviderAdd;

namespace {

class ProviderAdd : public CommandTest {
protected:
    ProviderAdd() {
        input->SetString("vp-name", "north");
        input->SetString("vp-url", "https://north:8443/orka");
    }
    std::vector<std::string> updates() const {
        return callsOf("StorageInfoImpl.UpdateLumoVendorProvider");
    }
};

TEST_F(ProviderAdd, WritesTheRecordAndReportsTheName) {
    input->SetStringList("arrayid", {"a1", "a2"});
    input->SetIntList("priority", {5, -7});
    input->SetBoolList("isactive", {true, false});
    run<VendorProviderAdd>();
    expectResultAlone("\"Succesfully Added VP with name : north\\n\"");
    EXPECT_THAT(ranCalls,
                ElementsAre("Input.GetString(\"vp-url\")", "Input.GetString(\"vp-name\")", "StorageInfoImpl()",
                            "StorageInfoImpl.LumoVpExists(\"north\")", "Input.GetStringList(\"arrayid\")",
                            "Input.GetIntList(\"priority\")", "Input.GetBoolList(\"isactive\")",
                            "StorageInfoImpl.UpdateLumoVendorProvider([\"north\" at \"https://north:8443/orka\" aux "
                            "\"\" arrays {\"a1\" active 5, \"a2\" passive -7}])",
                            "Output.SetResult(\"Succesfully Added VP with name : north\\n\")", "Output.Complete()",
                            "~StorageInfoImpl()"));
}

TEST_F(ProviderAdd, WithoutArraysWritesBackExactlyWhatTheHostHolds) {
    kestrel.getLumoVendorProviders.once(
        {{"north", "changed", "aux", {{"found", true, 3}}}, {"north", "second", "", {}}});
    run<VendorProviderAdd>();
    expectResultAlone("\"Succesfully Added VP with name : north\\n\"");
    EXPECT_THAT(callsOf("StorageInfoImpl."),
                ElementsAre("StorageInfoImpl.LumoVpExists(\"north\")",
                            "StorageInfoImpl.UpdateLumoVendorProvider([\"north\" at \"https://north:8443/orka\" aux "
                            "\"\" arrays {}])",
                            "StorageInfoImpl.GetLumoVendorProviders(\"north\", [])",
                            "StorageInfoImpl.UpdateLumoVendorProvider([\"north\" at \"changed\" aux \"aux\" arrays "
                            "{\"found\" active 3}, \"north\" at \"second\" aux \"\" arrays {}])"));
}

TEST_F(ProviderAdd, WithoutArraysWritesBackNothingWhenTheHostHoldsNothing) {
    run<VendorProviderAdd>();
    EXPECT_EQ(updates().back(), "StorageInfoImpl.UpdateLumoVendorProvider([])");
    EXPECT_EQ(updates().size(), 2U);
}

TEST_F(ProviderAdd, RefusesAnEmptyNameBeforeAskingTheHost) {
    input->SetString("vp-name", "");
    run<VendorProviderAdd>();
    expectMessageAlone("Empty VP Name not allowed.");
    EXPECT_THAT(ranCalls,
                ElementsAre("Input.GetString(\"vp-url\")", "Input.GetString(\"vp-name\")", "StorageInfoImpl()",
                            "Output.SetMessage(\"Empty VP Name not allowed.\")", "~StorageInfoImpl()"));
}

TEST_F(ProviderAdd, RefusesANameThatExistsBeforeReadingTheLists) {
    kestrel.lumoVpExists.once(true);
    input->SetStringList("arrayid", {"a1", "a2"});
    run<VendorProviderAdd>();
    expectMessageAlone("Cannot Add VP as : north already exists\n");
    EXPECT_THAT(callsOf("Input.Get"), ElementsAre("Input.GetString(\"vp-url\")", "Input.GetString(\"vp-name\")"));
    EXPECT_THAT(updates(), IsEmpty());
}

TEST_F(ProviderAdd, RefusesListsOfDifferentLength) {
    struct Lists {
        std::vector<std::string> arrayIds;
        std::vector<int64_t> priorities;
        std::vector<bool> active;
    };
    for (Lists const &lists : {Lists{{"a1", "a2"}, {1}, {true, false}}, Lists{{"a1"}, {1}, {}}, Lists{{}, {1}, {true}},
                               Lists{{"a1"}, {}, {}}, Lists{{"a1", "a2"}, {1, 2}, {true}}, Lists{{}, {}, {true}}}) {
        renewCall();
        input->SetString("vp-name", "north");
        input->SetStringList("arrayid", lists.arrayIds);
        input->SetIntList("priority", lists.priorities);
        input->SetBoolList("isactive", lists.active);
        run<VendorProviderAdd>();
        expectMessageAlone("Missing one of the  parameter arrayIdor priority or isActive for an Array ");
        EXPECT_THAT(updates(), IsEmpty());
    }
}

TEST_F(ProviderAdd, KeepsTheLow32BitsOfAPriority) {
    input->SetStringList("arrayid", {"a", "b", "c", "d"});
    input->SetIntList("priority", {(int64_t{1} << 32) + 1, int64_t{1} << 31, -1, INT64_MIN});
    input->SetBoolList("isactive", {true, true, true, true});
    run<VendorProviderAdd>();
    EXPECT_THAT(updates(), ElementsAre("StorageInfoImpl.UpdateLumoVendorProvider([\"north\" at "
                                       "\"https://north:8443/orka\" aux \"\" arrays {\"a\" active 1, \"b\" active "
                                       "-2147483648, \"c\" active -1, \"d\" active 0}])"));
}

TEST_F(ProviderAdd, StoresAnEmptyUrlAsGiven) {
    input->SetString("vp-url", "");
    run<VendorProviderAdd>();
    EXPECT_EQ(updates().front(), "StorageInfoImpl.UpdateLumoVendorProvider([\"north\" at \"\" aux \"\" arrays {}])");
}

TEST_F(ProviderAdd, ReportsAFailedWrite) {
    kestrel.updateLumoVendorProvider.throwOnce(gantryFailure("disk full"));
    run<VendorProviderAdd>();
    expectMessageAlone("Failed to add VP: disk full");
    EXPECT_EQ(updates().size(), 1U);
}

TEST_F(ProviderAdd, ReportsAFailedReadBackAndLeavesTheRecordWritten) {
    kestrel.getLumoVendorProviders.throwOnce(gantryFailure("cannot read"));
    run<VendorProviderAdd>();
    expectMessageAlone("Failed to add VP: cannot read");
    EXPECT_EQ(updates().size(), 1U);
    EXPECT_THAT(callsOf("LumoFileSystemImpl"), IsEmpty());
}

TEST_F(ProviderAdd, ReportsAFailedSecondWrite) {
    kestrel.updateLumoVendorProvider.once({}).throwOnce(gantryFailure("disk full"));
    run<VendorProviderAdd>();
    expectMessageAlone("Failed to add VP: disk full");
    EXPECT_EQ(updates().size(), 2U);
}

TEST_F(ProviderAdd, ReportsAFailureWhileTheResultIsSet) {
    output->onSetResult.throwOnce(gantryFailure("no room"));
    run<VendorProviderAdd>();
    expectMessageAlone("Failed to add VP: no room");
}

TEST_F(ProviderAdd, ReportsAFailureWhileTheOutputCompletes) {
    output->onComplete.throwOnce(gantryFailure("no room"));
    run<VendorProviderAdd>();
    expectMessageBehindResult("Failed to add VP: no room", "\"Succesfully Added VP with name : north\\n\"");
}

TEST_F(ProviderAdd, LetsAFailedExistenceCheckPass) {
    kestrel.lumoVpExists.throwOnce(gantryFailure("no store"));
    EXPECT_THROW(run<VendorProviderAdd>(), Gantry::Lib::GantryException);
    EXPECT_FALSE(output->HasMessage());
}

TEST_F(ProviderAdd, LetsAnUnexpectedExceptionPass) {
    kestrel.updateLumoVendorProvider.throwOnce(Unexpected("surprise"));
    EXPECT_THROW(run<VendorProviderAdd>(), Unexpected);
    EXPECT_FALSE(output->HasMessage());
}

TEST_F(ProviderAdd, NeedsNoDaemon) {
    run<VendorProviderAdd>();
    EXPECT_THAT(callsOf("LumoLib_"), IsEmpty());
}

} // namespace
