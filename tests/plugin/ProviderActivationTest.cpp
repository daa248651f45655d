// SPDX-License-Identifier: Apache-2.0
#include "CommandTest.h"
#include "VendorProviderActivate.h"
#include "VendorProviderDeactivate.h"

using namespace PluginTest;
using TarselCli::LumoNamespace::VendorProviderActivate;
using TarselCli::LumoNamespace::VendorProviderDeactivate;

namespace {

class ProviderActivation : public CommandTest {
protected:
    ProviderActivation() {
        input->SetString("vp-name", "north");
        input->SetString("arrayid", "array-1");
    }
};

TEST_F(ProviderActivation, ActivatePassesTheArrayFirstAndAZeroedBlock) {
    input->SetString("activevpurl", "https://active");
    run<VendorProviderActivate>();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls,
                ElementsAre("Input.GetString(\"arrayid\")", "Input.GetString(\"vp-name\")",
                            "Input.GetString(\"activevpurl\")",
                            "LumoLib_ActivateProvider(\"array-1\", \"north\", \"https://active\", 64 zero bytes)",
                            "Output.SetResult(true)", "Output.Complete()"));
}

TEST_F(ProviderActivation, ActivatePassesAnEmptyUrlWhenNoneWasGiven) {
    run<VendorProviderActivate>();
    EXPECT_THAT(callsOf("LumoLib_Act"),
                ElementsAre("LumoLib_ActivateProvider(\"array-1\", \"north\", \"\", 64 zero bytes)"));
}

TEST_F(ProviderActivation, ActivateZeroesTheBlockAgainForEachCall) {
    auto const command = VendorProviderActivate::New();
    command->ExecuteInternal(input, output);
    command->ExecuteInternal(input, output);
    EXPECT_EQ(callsOf("LumoLib_ActivateProvider(\"array-1\", \"north\", \"\", 64 zero bytes)").size(), 2U);
}

TEST_F(ProviderActivation, DeactivatePassesTheArrayFirst) {
    run<VendorProviderDeactivate>();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls, ElementsAre("Input.GetString(\"arrayid\")", "Input.GetString(\"vp-name\")",
                                      "LumoLib_DeactivateProvider(\"array-1\", \"north\")", "Output.SetResult(true)",
                                      "Output.Complete()"));
}

TEST_F(ProviderActivation, EmptyTextsGoToTheDaemonAsTheyAre) {
    input->SetString("vp-name", "");
    input->SetString("arrayid", "");
    run<VendorProviderActivate>();
    EXPECT_THAT(callsOf("LumoLib_Act"), ElementsAre("LumoLib_ActivateProvider(\"\", \"\", \"\", 64 zero bytes)"));
    run<VendorProviderDeactivate>();
    EXPECT_THAT(callsOf("LumoLib_Dea"), ElementsAre("LumoLib_DeactivateProvider(\"\", \"\")"));
}

TEST_F(ProviderActivation, AFailureIsOneLineThatEndsInANewline) {
    lumo.activateProvider.once(17);
    lumo.err2String.always(Text("No such array"));
    run<VendorProviderActivate>();
    expectMessageAlone("LumoLib_ActivateProvider failed with error No such array\n");
    EXPECT_THAT(callsOf("LumoLib_Err"), ElementsAre("LumoLib_Err2String(17)"));

    renewCall();
    lumo.deactivateProvider.once(-4);
    run<VendorProviderDeactivate>();
    expectMessageAlone("LumoLib_DeactivateProvider failed with error No such array\n");
    EXPECT_THAT(callsOf("LumoLib_Err"), ElementsAre("LumoLib_Err2String(-4)"));
}

TEST_F(ProviderActivation, AFailureWithoutATextEndsBehindThePrefix) {
    lumo.activateProvider.once(1);
    lumo.deactivateProvider.once(1);
    lumo.err2String.always(Text());
    run<VendorProviderActivate>();
    expectMessageAlone("LumoLib_ActivateProvider failed with error ");
    renewCall();
    run<VendorProviderDeactivate>();
    expectMessageAlone("LumoLib_DeactivateProvider failed with error ");
}

TEST_F(ProviderActivation, AnEmptyTextIsNotAMissingOne) {
    lumo.activateProvider.once(1);
    lumo.err2String.always(Text(""));
    run<VendorProviderActivate>();
    expectMessageAlone("LumoLib_ActivateProvider failed with error \n");
}

TEST_F(ProviderActivation, LeavesTheHostAlone) {
    run<VendorProviderActivate>();
    EXPECT_THAT(callsOf("StorageInfoImpl"), IsEmpty());
    run<VendorProviderDeactivate>();
    EXPECT_THAT(callsOf("StorageInfoImpl"), IsEmpty());
}

} // namespace
