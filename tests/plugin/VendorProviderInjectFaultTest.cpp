// SPDX-License-Identifier: Apache-2.0
#include "VendorProviderInjectFault.h"

#include <cstdlib>

#include "CommandTest.h"

using namespace PluginTest;
using TarselCli::LumoNamespace::VendorProviderInjectFault;

namespace {

class InjectFault : public CommandTest {
protected:
    InjectFault() {
        input->SetString("vp-name", "north");
        kestrel.lumoVpExists.always(true);
        kestrel.getLumoVendorProviders.always({{"north", "https://north", "", {}}});
    }
};

TEST_F(InjectFault, SendsStatusAndArraysWithTheRegisteredUrl) {
    input->SetString("status", "offline");
    input->SetStringList("arrayid", {"a1", "a2"});
    input->SetBoolList("isactive", {true, false});
    run<VendorProviderInjectFault>();
    expectResultAlone("\"Successfully Injected fault for VP with name : north\\n\"");
    EXPECT_THAT(ranCalls,
                ElementsAre("StorageInfoImpl()", "Input.GetString(\"status\")", "Input.GetString(\"vp-name\")",
                            "StorageInfoImpl.LumoVpExists(\"north\")", "Input.GetStringList(\"arrayid\")",
                            "Input.GetBoolList(\"isactive\")", "StorageInfoImpl.GetLumoVendorProviders(\"north\", [])",
                            "LumoLib_VendorProviderInjectFault(\"north\", \"https://north\", \"offline\", 2, [\"a1\" "
                            "active, \"a2\" passive])",
                            "Output.SetResult(\"Successfully Injected fault for VP with name : north\\n\")",
                            "Output.Complete()", "~StorageInfoImpl()"));
}

TEST_F(InjectFault, LeavesTheEntriesThatItAllocated) {
    input->SetStringList("arrayid", {"a1", "a2"});
    input->SetBoolList("isactive", {true, false});
    run<VendorProviderInjectFault>();
    LumoArrayFault *const entries = lumo.faultEntries;
    ASSERT_NE(entries, nullptr);
    EXPECT_EQ(entries[0].isActive, 1);
    EXPECT_EQ(entries[1].isActive, 0);
    EXPECT_EQ(entries[0].reserved, nullptr);
    EXPECT_EQ(entries[1].reserved, nullptr);
    std::free(entries); // ends the program if the command has released them, or has them from elsewhere
}

TEST_F(InjectFault, WithoutStatusAndArraysSendsTheDefaultStatusAndNoEntries) {
    run<VendorProviderInjectFault>();
    EXPECT_THAT(callsOf("LumoLib_"),
                ElementsAre("LumoLib_VendorProviderInjectFault(\"north\", \"https://north\", \"default\", 0, [])"));
}

TEST_F(InjectFault, PassesAnyStatusOn) {
    input->SetString("status", "OnLine?");
    run<VendorProviderInjectFault>();
    EXPECT_THAT(callsOf("LumoLib_"),
                ElementsAre("LumoLib_VendorProviderInjectFault(\"north\", \"https://north\", \"OnLine?\", 0, [])"));
}

TEST_F(InjectFault, TakesTheUrlOfTheFirstRecord) {
    kestrel.getLumoVendorProviders.once({{"north", "first", "", {}}, {"north", "second", "", {}}});
    run<VendorProviderInjectFault>();
    EXPECT_THAT(callsOf("LumoLib_"),
                ElementsAre("LumoLib_VendorProviderInjectFault(\"north\", \"first\", \"default\", 0, [])"));
}

TEST_F(InjectFault, RefusesAnUnknownProviderBeforeReadingTheLists) {
    kestrel.lumoVpExists.once(false);
    run<VendorProviderInjectFault>();
    expectMessageAlone("VP : north does not exist\n");
    EXPECT_THAT(callsOf("Input.GetStringList"), IsEmpty());
    EXPECT_THAT(callsOf("LumoLib_"), IsEmpty());
}

TEST_F(InjectFault, RefusesListsOfDifferentLength) {
    input->SetStringList("arrayid", {"a1", "a2"});
    input->SetBoolList("isactive", {true});
    run<VendorProviderInjectFault>();
    expectMessageAlone("Missing one of the parameter arrayId or isActive");
    EXPECT_THAT(callsOf("LumoLib_"), IsEmpty());
    EXPECT_THAT(callsOf("StorageInfoImpl.Get"), IsEmpty());
}

TEST_F(InjectFault, ReportsADaemonThatRefusesWithoutANewline) {
    lumo.injectFault.once(33);
    lumo.err2String.once(Text("Unknown status"));
    run<VendorProviderInjectFault>();
    expectMessageAlone("VendorProviderInjectFault failed for VP with name : north with error: Unknown status");
    EXPECT_THAT(callsOf("LumoLib_Err"), ElementsAre("LumoLib_Err2String(33)"));
}

TEST_F(InjectFault, ReportsADaemonThatHasNoTextForItsCode) {
    lumo.injectFault.once(33);
    lumo.err2String.once(Text());
    run<VendorProviderInjectFault>();
    expectMessageAlone("VendorProviderInjectFault failed for VP with name : north with error: ");
}

TEST_F(InjectFault, ReportsAFailedReadWithNothingBetweenTextAndCause) {
    kestrel.getLumoVendorProviders.throwOnce(gantryFailure("cannot read"));
    run<VendorProviderInjectFault>();
    expectMessageAlone("InjectFault failed for VPcannot read");
    EXPECT_THAT(callsOf("LumoLib_"), IsEmpty());
}

TEST_F(InjectFault, ReportsANameThatExistsWithoutARecordAndSendsNothing) {
    kestrel.getLumoVendorProviders.once({});
    run<VendorProviderInjectFault>();
    expectMessageAlone("InjectFault failed for VP: the host has no record of north");
    EXPECT_THAT(callsOf("LumoLib_"), IsEmpty());
}

TEST_F(InjectFault, LetsAFailedExistenceCheckPass) {
    kestrel.lumoVpExists.throwOnce(gantryFailure("no store"));
    EXPECT_THROW(run<VendorProviderInjectFault>(), Gantry::Lib::GantryException);
    EXPECT_FALSE(output->HasMessage());
}

TEST_F(InjectFault, LetsAnUnexpectedExceptionPass) {
    kestrel.getLumoVendorProviders.throwOnce(Unexpected("surprise"));
    EXPECT_THROW(run<VendorProviderInjectFault>(), Unexpected);
    EXPECT_FALSE(output->HasMessage());
}

TEST_F(InjectFault, LetsAFailureWhileTheResultIsSetPass) {
    output->onSetResult.throwOnce(gantryFailure("no room"));
    EXPECT_THROW(run<VendorProviderInjectFault>(), Gantry::Lib::GantryException);
}

} // namespace
