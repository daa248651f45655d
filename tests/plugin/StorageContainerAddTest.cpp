// SPDX-License-Identifier: Apache-2.0
#include "StorageContainerAdd.h"

#include "CommandTest.h"

using namespace PluginTest;
using TarselCli::LumoNamespace::StorageContainerAdd;

namespace {

class ContainerAdd : public CommandTest {
protected:
    ContainerAdd() {
        input->SetString("container-name", "gold");
        input->SetString("container-id", "G-1");
        kestrel.addLumoFileSystem.always(FileSystemScript("gold"));
    }
};

TEST_F(ContainerAdd, MountsTheContainerAndDeletesWhatTheHostReturned) {
    input->SetStringList("array", {"a1", "a2"});
    run<StorageContainerAdd>();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls,
                ElementsAre("StorageInfoImpl()", "Input.GetString(\"container-name\")",
                            "Input.GetString(\"container-id\")", "Input.GetStringList(\"array\")",
                            "StorageInfoImpl.AddLumoFileSystem(\"gold\", \"G-1\", [\"a1\", \"a2\"], true)",
                            "Output.SetResult(true)", "~fs(gold)", "Output.Complete()", "~StorageInfoImpl()"));
}

TEST_F(ContainerAdd, WithoutArraysPassesAnEmptyList) {
    run<StorageContainerAdd>();
    EXPECT_THAT(callsOf("StorageInfoImpl."),
                ElementsAre("StorageInfoImpl.AddLumoFileSystem(\"gold\", \"G-1\", [], true)"));
}

TEST_F(ContainerAdd, ShowsFalseWhenTheHostReturnsNothing) {
    kestrel.addLumoFileSystem.once(std::nullopt);
    run<StorageContainerAdd>();
    expectResultAlone("false");
}

TEST_F(ContainerAdd, ChecksNothingItself) {
    input->SetString("container-name", "");
    input->SetString("container-id", "");
    input->SetStringList("array", {""});
    run<StorageContainerAdd>();
    EXPECT_THAT(callsOf("StorageInfoImpl."),
                ElementsAre("StorageInfoImpl.AddLumoFileSystem(\"\", \"\", [\"\"], true)"));
}

TEST_F(ContainerAdd, ShowsTheHostsTextAlone) {
    kestrel.addLumoFileSystem.throwOnce(gantryFailure("already mounted"));
    run<StorageContainerAdd>();
    expectMessageAlone("already mounted");
}

TEST_F(ContainerAdd, ShowsAFailureWhileTheResultIsSet) {
    output->onSetResult.throwOnce(gantryFailure("no room"));
    run<StorageContainerAdd>();
    expectMessageAlone("no room");
}

TEST_F(ContainerAdd, ShowsAFailureWhileTheOutputCompletes) {
    output->onComplete.throwOnce(gantryFailure("no room"));
    run<StorageContainerAdd>();
    expectMessageBehindResult("no room", "true");
}

TEST_F(ContainerAdd, LetsAnUnexpectedExceptionPassAndReleasesTheHost) {
    kestrel.addLumoFileSystem.throwOnce(Unexpected("surprise"));
    EXPECT_THROW(run<StorageContainerAdd>(), Unexpected);
    EXPECT_FALSE(output->HasMessage());
}

TEST_F(ContainerAdd, NeedsNoDaemon) {
    run<StorageContainerAdd>();
    EXPECT_THAT(callsOf("LumoLib_"), IsEmpty());
}

} // namespace
