// SPDX-License-Identifier: Apache-2.0
#include "VendorProviderRemove.h"

#include "CommandTest.h"

using namespace PluginTest;
using TarselCli::LumoNamespace::VendorProviderRemove;

namespace {

class ProviderRemove : public CommandTest {
protected:
    ProviderRemove() {
        input->SetString("vp-name", "north");
    }
};

TEST_F(ProviderRemove, UnregistersTheProviderWithoutAskingTheDaemon) {
    run<VendorProviderRemove>();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls,
                ElementsAre("Input.GetString(\"vp-name\")", "LumoFileSystemImpl.UnRegisterVendorProvider(\"north\")",
                            "Output.SetResult(true)", "Output.Complete()"));
}

TEST_F(ProviderRemove, PassesAnEmptyNameOn) {
    input->SetString("vp-name", "");
    run<VendorProviderRemove>();
    EXPECT_THAT(callsOf("LumoFileSystemImpl."), ElementsAre("LumoFileSystemImpl.UnRegisterVendorProvider(\"\")"));
}

TEST_F(ProviderRemove, ShowsTheHostsTextAlone) {
    kestrel.unRegisterVendorProvider.throwOnce(gantryFailure("No provider named north.\n"));
    run<VendorProviderRemove>();
    expectMessageAlone("No provider named north.\n");
}

TEST_F(ProviderRemove, ShowsAFailureWhileTheResultIsSet) {
    output->onSetResult.throwOnce(gantryFailure("no room"));
    run<VendorProviderRemove>();
    expectMessageAlone("no room");
}

TEST_F(ProviderRemove, LetsAnUnexpectedExceptionPass) {
    kestrel.unRegisterVendorProvider.throwOnce(Unexpected("surprise"));
    EXPECT_THROW(run<VendorProviderRemove>(), Unexpected);
    EXPECT_FALSE(output->HasMessage());
}

} // namespace
