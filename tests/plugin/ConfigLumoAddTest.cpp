// SPDX-License-Identifier: Apache-2.0
#include "ConfigLumoAdd.h"

#include "CommandTest.h"

using namespace PluginTest;
using TarselCli::LumoNamespace::ConfigLumoAdd;

namespace {

class ConfigAdd : public CommandTest {
protected:
    ConfigAdd() {
        input->SetString("name", "vm-1");
        input->SetString("container-id", "cid");
        gold.hasContainerId.always(true);
    }
    void hostHas(std::vector<FileSystemScript> const &fileSystems) {
        kestrel.getLumoFileSystems.always(fileSystems);
    }
    FileSystemScript silver{"silver"};
    FileSystemScript gold{"gold"};
};

TEST_F(ConfigAdd, CreatesTheVolumeInTheContainersFileSystem) {
    input->SetInt("size", 4096);
    input->SetString("policy", "thin");
    input->SetString("vmuuid", "vm-uuid");
    input->SetFlag("priority");
    hostHas({silver, gold});
    run<ConfigLumoAdd>();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls,
                ElementsAre("StorageInfoImpl()", "Input.GetString(\"name\")", "Input.GetString(\"container-id\")",
                            "Input.HasParameter(\"priority\")", "Input.HasParameter(\"size\")",
                            "Input.GetInt(\"size\")", "Input.HasParameter(\"vmuuid\")", "Input.GetString(\"vmuuid\")",
                            "Input.HasParameter(\"policy-file\")", "Input.HasParameter(\"policy\")",
                            "Input.GetString(\"policy\")", "StorageInfoImpl.GetLumoFileSystems()",
                            "fs(silver).HasContainerId(\"cid\")", "fs(gold).HasContainerId(\"cid\")",
                            "fs(gold).CreateConfigLumo(\"vm-1\", \"thin\", 4096, \"vm-uuid\", \"\", \"\", true)",
                            "Output.SetResult(true)", "Output.Complete()", "~fs(silver)", "~fs(gold)",
                            "~StorageInfoImpl()"));
}

TEST_F(ConfigAdd, WithoutOptionsPassesZeroSizeAndEmptyTexts) {
    hostHas({gold});
    run<ConfigLumoAdd>();
    expectResultAlone("true");
    EXPECT_THAT(callsOf("fs(gold).Create"),
                ElementsAre("fs(gold).CreateConfigLumo(\"vm-1\", \"\", 0, \"\", \"\", \"\", false)"));
    EXPECT_THAT(callsOf("Input.GetInt"), IsEmpty());
}

TEST_F(ConfigAdd, PassesAnySizeUnchanged) {
    for (int64_t const size : {int64_t{-1}, int64_t{0}, INT64_MAX, INT64_MIN}) {
        input->SetInt("size", size);
        hostHas({gold});
        run<ConfigLumoAdd>();
        EXPECT_THAT(callsOf("fs(gold).Create"), ElementsAre("fs(gold).CreateConfigLumo(\"vm-1\", \"\", " +
                                                            std::to_string(size) + ", \"\", \"\", \"\", false)"));
    }
}

TEST_F(ConfigAdd, UsesTheFirstFileSystemThatAcceptsTheId) {
    FileSystemScript second("second");
    second.hasContainerId.always(true);
    hostHas({silver, gold, second});
    run<ConfigLumoAdd>();
    EXPECT_EQ(callsOf("fs(gold).Create").size(), 1U);
    EXPECT_THAT(callsOf("fs(second)"), IsEmpty());
    EXPECT_THAT(callsOf("~fs"), ElementsAre("~fs(silver)", "~fs(gold)", "~fs(second)"));
}

TEST_F(ConfigAdd, ShowsFalseForAContainerThatIsNotMounted) {
    for (std::vector<FileSystemScript> const &fileSystems : {std::vector<FileSystemScript>{}, {silver, silver}}) {
        hostHas(fileSystems);
        run<ConfigLumoAdd>();
        EXPECT_EQ(output->GetMessage(), "Failed to find Lumo StorageContainer cid");
        EXPECT_EQ(result(), "false");
        EXPECT_FALSE(output->IsComplete());
        EXPECT_THAT(callsOf("Output."), ElementsAre("Output.SetMessage(\"Failed to find Lumo StorageContainer cid\")",
                                                    "Output.SetResult(false)"));
    }
}

TEST_F(ConfigAdd, ReportsAFailedCreationWithoutAResult) {
    gold.create.throwOnce(gantryFailure("out of space"));
    hostHas({gold});
    run<ConfigLumoAdd>();
    expectMessageAlone("Failed to create Config-Lumo. out of space");
    EXPECT_THAT(callsOf("Output.SetResult"), IsEmpty());
}

TEST_F(ConfigAdd, ReportsAFailureWhileTheResultIsSet) {
    output->onSetResult.throwOnce(gantryFailure("no room"));
    hostHas({gold});
    run<ConfigLumoAdd>();
    expectMessageAlone("Failed to create Config-Lumo. no room");
}

TEST_F(ConfigAdd, LetsAHostThatCannotListPass) {
    kestrel.getLumoFileSystems.throwOnce(gantryFailure("no store"));
    EXPECT_THROW(run<ConfigLumoAdd>(), Gantry::Lib::GantryException);
    EXPECT_FALSE(output->HasMessage());
}

TEST_F(ConfigAdd, LetsAFailedMatchPassAndReleasesEveryFileSystem) {
    silver.hasContainerId.throwAlways(gantryFailure("no id"));
    hostHas({silver, gold});
    EXPECT_THROW(run<ConfigLumoAdd>(), Gantry::Lib::GantryException);
    EXPECT_FALSE(output->HasMessage());
    EXPECT_THAT(callsOf("~"), ElementsAre("~fs(silver)", "~fs(gold)", "~StorageInfoImpl()"));
}

TEST_F(ConfigAdd, LetsAnUnexpectedExceptionPassAndReleasesEveryFileSystem) {
    gold.create.throwOnce(Unexpected("surprise"));
    hostHas({gold, silver});
    EXPECT_THROW(run<ConfigLumoAdd>(), Unexpected);
    EXPECT_THAT(callsOf("~"), ElementsAre("~fs(gold)", "~fs(silver)", "~StorageInfoImpl()"));
}

TEST_F(ConfigAdd, NeedsNoDaemon) {
    hostHas({gold});
    run<ConfigLumoAdd>();
    EXPECT_THAT(callsOf("LumoLib_"), IsEmpty());
}

} // namespace
