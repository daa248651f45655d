// SPDX-License-Identifier: Apache-2.0
#include "StorageContainerLoad.h"

#include "CommandTest.h"

using namespace PluginTest;
using Doubles::ContainerReply;
using Doubles::StorageArray;
using TarselCli::LumoNamespace::StorageContainerLoad;

namespace {

class ContainerLoad : public CommandTest {
protected:
    void daemonExports(std::vector<Container> const &containers) {
        lumo.getStorageContainer.once(ContainerReply{0, "", lumo.records.containers(containers)});
    }
    void hostHas(std::vector<FileSystemScript> const &fileSystems) {
        kestrel.getLumoFileSystems.once(fileSystems);
    }
    void hostMounts(std::string const &label) {
        kestrel.addLumoFileSystem.once(FileSystemScript(label));
    }
    std::vector<std::string> adds() const {
        return callsOf("StorageInfoImpl.AddLumoFileSystem");
    }
};

Container named(std::string const &name) {
    return {Text(name), Text(name + "-id"), Text("https://vp"), 0, {}};
}

TEST_F(ContainerLoad, MountsAContainerAndPrintsNameAndIdAsTheHostHasThem) {
    daemonExports({{Text("gold"),
                    Text("G1"),
                    Text("https://north/orka"),
                    (int64_t{1} << 40) + 7,
                    {{Text("array-1"), Text("One"), Text("Maker"), Text("M1"), {}}}}});
    hostHas({FileSystemScript("silver")});
    FileSystemScript mounted("mount");
    mounted.name.always("gold on host");
    mounted.id.always("g-1 on host");
    kestrel.addLumoFileSystem.once(mounted);
    run<StorageContainerLoad>();
    std::string const printed =
        "[StorageContainer{StorageContainer Name: \"gold on host\", StorageContainer Id: \"g-1 on host\", "
        "Max Lumo Size (MB): 1099511627783, VP URL: \"https://north/orka\", Arrays: [Array{ArrayId: \"array-1\", "
        "Name: \"One\", VendorId: \"Maker\", ModelId: \"M1\", PEInfo: []}]}]";
    expectResultAlone(printed);
    EXPECT_THAT(ranCalls, ElementsAre("StorageInfoImpl()", "LumoLib_GetStorageContainer(1, null, &null)",
                                      "LumoLib_ErrorExIsSuccess(error)", "StorageInfoImpl.GetLumoFileSystems()",
                                      "fs(silver).GetName()",
                                      "StorageInfoImpl.AddLumoFileSystem(\"gold\", \"G1\", [\"array-1\"], true)",
                                      "fs(mount).GetName()", "fs(mount).GetId()", "Output.SetResult(" + printed + ")",
                                      "Output.Complete()", "~fs(mount)", "~fs(silver)",
                                      "LumoLib_FreeStorageContainerResult(result)", "~StorageInfoImpl()"));
}

TEST_F(ContainerLoad, ShowsAnEmptyListWhenTheDaemonExportsNothing) {
    daemonExports({});
    hostHas({FileSystemScript("silver"), FileSystemScript("bronze")});
    run<StorageContainerLoad>();
    expectResultAlone("[]");
    EXPECT_THAT(adds(), IsEmpty());
}

TEST_F(ContainerLoad, SkipsEveryContainerThatIsMounted) {
    daemonExports({named("gold"), named("silver")});
    hostHas({FileSystemScript("silver"), FileSystemScript("gold")});
    run<StorageContainerLoad>();
    expectResultAlone("[]");
    EXPECT_THAT(adds(), IsEmpty());
}

TEST_F(ContainerLoad, ComparesNamesExactly) {
    daemonExports({named("Gold")});
    hostHas({FileSystemScript("gold"), FileSystemScript("Gold ")});
    hostMounts("Gold");
    run<StorageContainerLoad>();
    EXPECT_EQ(adds().size(), 1U);
}

TEST_F(ContainerLoad, AddsAContainerWithoutArraysWithAnEmptyList) {
    daemonExports({named("gold")});
    hostMounts("gold");
    run<StorageContainerLoad>();
    EXPECT_THAT(adds(), ElementsAre("StorageInfoImpl.AddLumoFileSystem(\"gold\", \"gold-id\", [], true)"));
    expectResultAlone("[StorageContainer{StorageContainer Name: \"gold\", StorageContainer Id: \"gold-id\", "
                      "Max Lumo Size (MB): 0, VP URL: \"https://vp\", Arrays: []}]");
}

TEST_F(ContainerLoad, KeepsOrderAndLeavesEveryMountButTheLastUndeleted) {
    daemonExports({named("c"), named("a"), named("b")});
    hostMounts("c");
    hostMounts("a");
    hostMounts("b");
    run<StorageContainerLoad>();
    leftOver.fileSystems = 2;
    EXPECT_THAT(adds(), ElementsAre("StorageInfoImpl.AddLumoFileSystem(\"c\", \"c-id\", [], true)",
                                    "StorageInfoImpl.AddLumoFileSystem(\"a\", \"a-id\", [], true)",
                                    "StorageInfoImpl.AddLumoFileSystem(\"b\", \"b-id\", [], true)"));
    std::string const rest = "-id\", Max Lumo Size (MB): 0, VP URL: \"https://vp\", Arrays: []}";
    expectResultAlone("[StorageContainer{StorageContainer Name: \"c\", StorageContainer Id: \"c" + rest +
                      ", StorageContainer{StorageContainer Name: \"a\", StorageContainer Id: \"a" + rest +
                      ", StorageContainer{StorageContainer Name: \"b\", StorageContainer Id: \"b" + rest + "]");
    EXPECT_THAT(callsOf("~fs"), ElementsAre("~fs(b)"));
}

TEST_F(ContainerLoad, AddsAContainerTwiceThatIsListedTwice) {
    daemonExports({named("twin"), named("twin")});
    hostMounts("first");
    hostMounts("second");
    run<StorageContainerLoad>();
    leftOver.fileSystems = 1;
    EXPECT_EQ(adds().size(), 2U);
}

TEST_F(ContainerLoad, GivesNoRowToAContainerThatTheHostDeclinesAndGoesOn) {
    daemonExports({named("declined"), named("gold")});
    kestrel.addLumoFileSystem.once(std::nullopt);
    hostMounts("gold");
    run<StorageContainerLoad>();
    expectResultAlone("[StorageContainer{StorageContainer Name: \"gold\", StorageContainer Id: \"gold-id\", "
                      "Max Lumo Size (MB): 0, VP URL: \"https://vp\", Arrays: []}]");
}

TEST_F(ContainerLoad, DeletesNothingWhenTheHostDeclinesTheLastContainer) {
    daemonExports({named("gold"), named("declined")});
    hostMounts("gold");
    run<StorageContainerLoad>();
    leftOver.fileSystems = 1;
    EXPECT_THAT(callsOf("~fs"), IsEmpty());
}

TEST_F(ContainerLoad, ReadsMissingTextsOfContainersAndArraysAsEmpty) {
    daemonExports({{Text(), Text(), Text(), 1, {StorageArray()}}});
    hostMounts("nameless");
    run<StorageContainerLoad>();
    EXPECT_THAT(adds(), ElementsAre("StorageInfoImpl.AddLumoFileSystem(\"\", \"\", [\"\"], true)"));
    expectResultAlone("[StorageContainer{StorageContainer Name: \"nameless\", StorageContainer Id: \"nameless-id\", "
                      "Max Lumo Size (MB): 1, VP URL: \"\", Arrays: [Array{ArrayId: \"\", Name: \"\", VendorId: \"\", "
                      "ModelId: \"\", PEInfo: []}]}]");
}

TEST_F(ContainerLoad, FindsASecondTimeWhatItMountedTheFirstTime) {
    daemonExports({named("gold")});
    hostMounts("gold");
    daemonExports({named("gold")});
    auto const command = StorageContainerLoad::New();
    command->ExecuteInternal(input, output);
    renewCall();
    hostHas({FileSystemScript("gold")});
    command->ExecuteInternal(input, output);
    expectResultAlone("[]");
}

TEST_F(ContainerLoad, ReportsARefusedQueryAndFreesNothing) {
    lumo.getStorageContainer.once(ContainerReply{9, "the daemon is gone", lumo.records.containers({})});
    run<StorageContainerLoad>();
    leftOver.results = 1;
    expectMessageAlone("Unable to load Lumo datastores: the daemon is gone");
    EXPECT_THAT(ranCalls, ElementsAre("StorageInfoImpl()", "LumoLib_GetStorageContainer(1, null, &null)",
                                      "LumoLib_ErrorExIsSuccess(error)", "LumoLib_ErrorExStr(error)",
                                      "Output.SetMessage(\"Unable to load Lumo datastores: the daemon is gone\")",
                                      "~StorageInfoImpl()"));
}

TEST_F(ContainerLoad, ReportsAHostThatCannotListItsFileSystems) {
    daemonExports({named("gold")});
    kestrel.getLumoFileSystems.throwOnce(gantryFailure("no store"));
    run<StorageContainerLoad>();
    expectMessageAlone("Error getting/adding lumo file system 'no store, skipping");
    EXPECT_THAT(callsOf("LumoLib_Free"), ElementsAre("LumoLib_FreeStorageContainerResult(result)"));
}

TEST_F(ContainerLoad, StopsAtTheFirstFailedMountAndShowsNoRows) {
    daemonExports({named("gold"), named("bad"), named("later")});
    hostHas({FileSystemScript("silver")});
    hostMounts("gold");
    kestrel.addLumoFileSystem.throwOnce(gantryFailure("name is taken"));
    run<StorageContainerLoad>();
    leftOver.fileSystems = 1; // the one mounted last is not released on this path
    expectMessageAlone("Error getting/adding lumo file system 'name is taken, skipping");
    EXPECT_EQ(adds().size(), 2U);
    EXPECT_THAT(callsOf("StorageInfoImpl.Remove"), IsEmpty()) << "what is mounted stays mounted";
    EXPECT_THAT(callsOf("~"), ElementsAre("~fs(silver)", "~StorageInfoImpl()"));
    EXPECT_THAT(callsOf("LumoLib_Free"), ElementsAre("LumoLib_FreeStorageContainerResult(result)"));
}

TEST_F(ContainerLoad, ReportsAFileSystemThatCannotTellItsName) {
    daemonExports({named("gold")});
    FileSystemScript broken("broken");
    broken.name.throwAlways(gantryFailure("no name"));
    kestrel.addLumoFileSystem.once(broken);
    run<StorageContainerLoad>();
    leftOver.fileSystems = 1;
    expectMessageAlone("Error getting/adding lumo file system 'no name, skipping");
}

TEST_F(ContainerLoad, ReportsAMountedFileSystemThatCannotTellItsName) {
    daemonExports({named("gold")});
    FileSystemScript broken("broken");
    broken.name.throwAlways(gantryFailure("no name"));
    hostHas({FileSystemScript("silver"), broken});
    run<StorageContainerLoad>();
    expectMessageAlone("Error getting/adding lumo file system 'no name, skipping");
    EXPECT_THAT(callsOf("~fs"), ElementsAre("~fs(silver)", "~fs(broken)"));
}

TEST_F(ContainerLoad, ReportsAFailureWhileTheResultIsSet) {
    daemonExports({named("gold")});
    hostMounts("gold");
    output->onSetResult.throwOnce(gantryFailure("no room"));
    run<StorageContainerLoad>();
    leftOver.fileSystems = 1;
    expectMessageAlone("Error getting/adding lumo file system 'no room, skipping");
}

TEST_F(ContainerLoad, ReleasesOnlyTheHostInterfaceWhenAnUnexpectedExceptionPasses) {
    daemonExports({named("gold"), named("bad")});
    hostHas({FileSystemScript("silver")});
    hostMounts("gold");
    kestrel.addLumoFileSystem.throwOnce(Unexpected("surprise"));
    EXPECT_THROW(run<StorageContainerLoad>(), Unexpected);
    leftOver.fileSystems = 2;
    leftOver.results = 1;
    EXPECT_FALSE(output->HasMessage());
    EXPECT_THAT(callsOf("~"), ElementsAre("~StorageInfoImpl()"));
    EXPECT_THAT(callsOf("LumoLib_Free"), IsEmpty());
}

} // namespace
