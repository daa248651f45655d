// SPDX-License-Identifier: Apache-2.0
#include "StorageContainerRemove.h"

#include "CommandTest.h"

using namespace PluginTest;
using TarselCli::LumoNamespace::StorageContainerRemove;

namespace {

class ContainerRemove : public CommandTest {
protected:
    ContainerRemove() {
        input->SetString("container-id", "{GIVEN}");
    }
};

TEST_F(ContainerRemove, RemovesTheFileSystemOfTheCanonicalId) {
    lumo.normalizeContainerId.once(Text("11111111-2222-3333-4444-555555555555"));
    run<StorageContainerRemove>();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls, ElementsAre("StorageInfoImpl()", "Input.GetString(\"container-id\")",
                                      "LumoLib_NormalizeContainerIdString(\"{GIVEN}\")",
                                      "StorageInfoImpl.RemoveLumoFileSystem(\"11111111-2222-3333-4444-555555555555\")",
                                      "Output.SetResult(true)", "Output.Complete()", "~StorageInfoImpl()"));
}

TEST_F(ContainerRemove, ShowsABadIdAsItWasGiven) {
    for (std::string const id : {"", " not an id ", "11111111-2222-3333-4444-55555555555Z"}) {
        renewCall();
        input->SetString("container-id", id);
        lumo.normalizeContainerId.once(Text());
        run<StorageContainerRemove>();
        expectMessageAlone("Bad CID : " + id);
        EXPECT_THAT(callsOf("StorageInfoImpl."), IsEmpty());
    }
}

TEST_F(ContainerRemove, ShowsTheHostsTextAlone) {
    kestrel.removeLumoFileSystem.throwOnce(gantryFailure("not mounted"));
    run<StorageContainerRemove>();
    expectMessageAlone("not mounted");
}

TEST_F(ContainerRemove, ShowsAFailureWhileTheResultIsSet) {
    output->onSetResult.throwOnce(gantryFailure("no room"));
    run<StorageContainerRemove>();
    expectMessageAlone("no room");
}

TEST_F(ContainerRemove, ShowsAFailureWhileTheOutputCompletes) {
    output->onComplete.throwOnce(gantryFailure("no room"));
    run<StorageContainerRemove>();
    expectMessageBehindResult("no room", "true");
}

TEST_F(ContainerRemove, LetsAnUnexpectedExceptionPassAndReleasesTheHost) {
    kestrel.removeLumoFileSystem.throwOnce(Unexpected("surprise"));
    EXPECT_THROW(run<StorageContainerRemove>(), Unexpected);
    EXPECT_FALSE(output->HasMessage());
}

} // namespace
