// SPDX-License-Identifier: Apache-2.0
//
// Mounting, unmounting and removing a config volume: one design, told once for the three.
#include <functional>

#include "CommandTest.h"
#include "ConfigLumoMountdir.h"
#include "ConfigLumoRemove.h"
#include "ConfigLumoUmountdir.h"

using namespace PluginTest;
using namespace TarselCli::LumoNamespace;

namespace {

struct Volume {
    char const *title;
    std::function<boost::shared_ptr<Plexa::AutoCli::Command>()> make;
    char const *operation;
    Doubles::Answers<Doubles::Done> FileSystemScript::*answer;
    char const *missingText;
};

void PrintTo(Volume const &volume, std::ostream *stream) {
    *stream << volume.operation;
}

class ConfigVolume : public CommandTest, public testing::WithParamInterface<Volume> {
protected:
    ConfigVolume() {
        input->SetString("container-id", "cid");
        gold.hasContainerId.always(true);
    }
    void hostHas(std::vector<FileSystemScript> const &fileSystems) {
        kestrel.getLumoFileSystems.always(fileSystems);
    }
    void runIt() {
        auto const command = GetParam().make();
        log.clear();
        command->ExecuteInternal(input, output);
        ranCalls = log.lines();
    }
    /// The operation's line in the log.
    std::string lineOf(std::string const &arguments) const {
        return "fs(gold)." + std::string(GetParam().operation) + "(" + arguments + ")";
    }
    std::vector<std::string> operations() const {
        return callsOf("fs(gold)." + std::string(GetParam().operation));
    }
    FileSystemScript silver{"silver"};
    FileSystemScript gold{"gold"};
};

TEST_P(ConfigVolume, IsNamedByUuid) {
    input->SetString("uuid", "u-1");
    input->SetFlag("priority");
    hostHas({silver, gold});
    runIt();
    expectResultAlone("true");
    EXPECT_THAT(ranCalls, ElementsAre("StorageInfoImpl()", "Input.GetString(\"container-id\")",
                                      "Input.HasParameter(\"priority\")", "Input.HasParameter(\"uuid\")",
                                      "Input.GetString(\"uuid\")", "StorageInfoImpl.GetLumoFileSystems()",
                                      "fs(silver).HasContainerId(\"cid\")", "fs(gold).HasContainerId(\"cid\")",
                                      lineOf("\"\", \"u-1\", \"\", true"), "Output.SetResult(true)",
                                      "Output.Complete()", "~fs(silver)", "~fs(gold)", "~StorageInfoImpl()"));
}

TEST_P(ConfigVolume, IsNamedByDirectory) {
    input->SetString("name", "vm-1");
    hostHas({gold});
    runIt();
    expectResultAlone("true");
    EXPECT_THAT(operations(), ElementsAre(lineOf("\"vm-1\", \"\", \"\", false")));
}

TEST_P(ConfigVolume, IsNamedByUuidWhenBothAreGiven) {
    input->SetString("name", "vm-1");
    input->SetString("uuid", "u-1");
    hostHas({gold});
    runIt();
    EXPECT_THAT(operations(), ElementsAre(lineOf("\"\", \"u-1\", \"\", false")));
    EXPECT_THAT(callsOf("Input.HasParameter(\"name\")"), IsEmpty());
    EXPECT_THAT(callsOf("Input.GetString(\"name\")"), IsEmpty());
}

TEST_P(ConfigVolume, MayBeNamedByAnEmptyUuid) {
    input->SetString("name", "vm-1");
    input->SetString("uuid", "");
    hostHas({gold});
    runIt();
    EXPECT_THAT(operations(), ElementsAre(lineOf("\"\", \"\", \"\", false")));
}

TEST_P(ConfigVolume, IsAskedForBeforeTheHostIs) {
    hostHas({gold});
    runIt();
    EXPECT_EQ(output->GetMessage(), GetParam().missingText);
    EXPECT_EQ(result(), "false");
    EXPECT_FALSE(output->IsComplete());
    EXPECT_THAT(callsOf("StorageInfoImpl."), IsEmpty());
    EXPECT_THAT(callsOf("Output."), ElementsAre("Output.SetMessage(" + Doubles::quoted(GetParam().missingText) + ")",
                                                "Output.SetResult(false)"));
}

TEST_P(ConfigVolume, OfAContainerThatIsNotMountedGivesFalse) {
    input->SetString("name", "vm-1");
    for (std::vector<FileSystemScript> const &fileSystems : {std::vector<FileSystemScript>{}, {silver, silver}}) {
        hostHas(fileSystems);
        runIt();
        EXPECT_EQ(output->GetMessage(), "Failed to find Lumo StorageContainer cid");
        EXPECT_EQ(result(), "false");
        EXPECT_FALSE(output->IsComplete());
    }
}

TEST_P(ConfigVolume, IsLookedForInTheFirstFileSystemThatAcceptsTheId) {
    input->SetString("name", "vm-1");
    FileSystemScript second("second");
    second.hasContainerId.always(true);
    hostHas({gold, second});
    runIt();
    EXPECT_EQ(operations().size(), 1U);
    EXPECT_THAT(callsOf("fs(second)"), IsEmpty());
}

TEST_P(ConfigVolume, IsWorkedOnByTheOneOperationAlone) {
    input->SetString("name", "vm-1");
    hostHas({gold});
    runIt();
    EXPECT_THAT(callsOf("fs(gold)."),
                ElementsAre("fs(gold).HasContainerId(\"cid\")", lineOf("\"vm-1\", \"\", \"\", false")));
}

TEST_P(ConfigVolume, ShowsTheHostsTextAlone) {
    input->SetString("name", "vm-1");
    (gold.*(GetParam().answer)).throwOnce(gantryFailure("volume is busy"));
    hostHas({gold, silver});
    runIt();
    expectMessageAlone("volume is busy");
    EXPECT_THAT(callsOf("~"), ElementsAre("~fs(gold)", "~fs(silver)", "~StorageInfoImpl()"));
}

TEST_P(ConfigVolume, ShowsTheTextOfAFailedMatch) {
    input->SetString("name", "vm-1");
    silver.hasContainerId.throwAlways(gantryFailure("no id"));
    hostHas({silver, gold});
    runIt();
    expectMessageAlone("no id");
    EXPECT_THAT(operations(), IsEmpty());
}

TEST_P(ConfigVolume, ShowsAFailureWhileTheResultIsSet) {
    input->SetString("name", "vm-1");
    output->onSetResult.throwOnce(gantryFailure("no room"));
    hostHas({gold});
    runIt();
    expectMessageAlone("no room");
}

TEST_P(ConfigVolume, LetsAHostThatCannotListPass) {
    input->SetString("name", "vm-1");
    kestrel.getLumoFileSystems.throwOnce(gantryFailure("no store"));
    EXPECT_THROW(runIt(), Gantry::Lib::GantryException);
    EXPECT_FALSE(output->HasMessage());
}

TEST_P(ConfigVolume, LetsAnUnexpectedExceptionPassAndReleasesEveryFileSystem) {
    input->SetString("name", "vm-1");
    (gold.*(GetParam().answer)).throwOnce(Unexpected("surprise"));
    hostHas({silver, gold});
    EXPECT_THROW(runIt(), Unexpected);
    EXPECT_THAT(callsOf("~"), ElementsAre("~fs(silver)", "~fs(gold)", "~StorageInfoImpl()"));
}

TEST_P(ConfigVolume, NeedsNoDaemon) {
    input->SetString("name", "vm-1");
    hostHas({gold});
    runIt();
    EXPECT_THAT(callsOf("LumoLib_"), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(, ConfigVolume,
                         testing::Values(Volume{"Mount", ConfigLumoMountdir::New, "MountConfigLumo",
                                                &FileSystemScript::mount, "Either name or uuid is required"},
                                         Volume{"Umount", ConfigLumoUmountdir::New, "UnmountConfigLumo",
                                                &FileSystemScript::unmount,
                                                "Either StorageContainer Name or UUID is required"},
                                         Volume{"Remove", ConfigLumoRemove::New, "RemoveConfigLumo",
                                                &FileSystemScript::remove, "Either name or uuid is required"}),
                         [](auto const &volume) { return std::string(volume.param.title); });

} // namespace
