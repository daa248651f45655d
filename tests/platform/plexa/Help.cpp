// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "SampleCommand.h"
#include "plexa/TreeHelp.h"

namespace {

using namespace Plexa;

boost::shared_ptr<SampleCommand> providerAdd() {
    auto const command = SampleCommand::New();
    command->SetDescription("Add a new provider.");
    command->parameter("vp-name", CallSpec::String, "n", "Name of the provider.")->SetRequired(true);
    command->parameter("size", CallSpec::Int, "", "Size in MB, as the array counts it, rounded up.");
    command->parameter("enabled", CallSpec::Bool, "e", "Whether it is.");
    command->parameter("clear", CallSpec::Flag, "c", "Clears.");
    command->parameter("arrayid", CallSpec::StringList, "a", "An array.");
    return command;
}

TEST(Help, CommandListsOptionsInDeclaredOrder) {
    auto const root = AutoCli::Namespace::New();
    auto const command = providerAdd();
    root->RegisterNamespaceNode(command, "add");
    EXPECT_EQ(commandHelpText(*command, "tovicli", 60), "Usage:\n"
                                                        "  tovicli add --vp-name TEXT [options]\n"
                                                        "\n"
                                                        "Add a new provider.\n"
                                                        "\n"
                                                        "Options:\n"
                                                        "  -n, --vp-name TEXT        Required. Name of the provider.\n"
                                                        "      --size NUMBER         Size in MB, as the array counts\n"
                                                        "                            it, rounded up.\n"
                                                        "  -e, --enabled true|false  Whether it is.\n"
                                                        "  -c, --clear               Clears.\n"
                                                        "  -a, --arrayid TEXT        May be repeated. An array.\n");
}

TEST(Help, CommandTellsTheFieldsOfItsResult) {
    auto const inner = MetaObj::MetaStruct::New("Array");
    inner->SetField("ArrayId", MetaObj::MetaString::New());
    auto const outer = MetaObj::MetaStruct::New("Container");
    outer->SetField("Container Name", MetaObj::MetaString::New());
    outer->SetField("Arrays", MetaObj::MetaList::New(MetaObj::StructList, inner));
    auto const root = AutoCli::Namespace::New();
    auto const command = SampleCommand::New();
    command->SetDescription("Two  blanks stay.");
    command->output->SetOutputType(MetaObj::MetaList::New(MetaObj::StructList, outer));
    command->AddExample("tovicli load", "Loads all.");
    root->RegisterNamespaceNode(command, "load");
    EXPECT_EQ(commandHelpText(*command, "tovicli", 80), "Usage:\n"
                                                        "  tovicli load\n"
                                                        "\n"
                                                        "Two  blanks stay.\n"
                                                        "\n"
                                                        "Result: a list, each element with the fields:\n"
                                                        "  Container Name  text\n"
                                                        "  Arrays          list, each element with:\n"
                                                        "    ArrayId       text\n"
                                                        "\n"
                                                        "Examples:\n"
                                                        "  Loads all.\n"
                                                        "      tovicli load\n");
}

TEST(Help, ResultTellsKindsAndUnits) {
    auto const structure = MetaObj::MetaStruct::New("Volume");
    structure->SetField("Name", MetaObj::MetaString::New());
    structure->SetField("Size", MetaObj::MetaInt::New());
    structure->SetField("Ready", MetaObj::MetaBool::New());
    structure->SetField("Tags", MetaObj::MetaList::New(MetaObj::StringList));
    auto const command = SampleCommand::New();
    command->output->SetOutputType(structure);
    command->SetDefaultOutputParameter("units:Volume.Size", "MB");
    EXPECT_NE(commandHelpText(*command, "tovicli", 80)
                  .find("Result: a structure with the fields:\n"
                        "  Name   text\n"
                        "  Size   whole number, MB\n"
                        "  Ready  true or false\n"
                        "  Tags   list of texts\n"),
              std::string::npos);
    command->output->SetOutputType(MetaObj::MetaBool::New());
    EXPECT_NE(commandHelpText(*command, "tovicli", 80).find("\nResult: true or false\n"), std::string::npos);
    command->output->SetOutputType(nullptr);
    EXPECT_EQ(commandHelpText(*command, "tovicli", 80).find("Result"), std::string::npos);
}

TEST(Help, UsageIsBrokenBetweenOptionsOnly) {
    auto const command = SampleCommand::New();
    command->parameter("name", CallSpec::String)->SetRequired(true);
    command->parameter("size", CallSpec::Int)->SetRequired(true);
    command->parameter("word", CallSpec::StringList);
    command->SetMetaDataField("positional", "word");
    auto const root = AutoCli::Namespace::New();
    root->RegisterNamespaceNode(command, "add");
    EXPECT_EQ(commandHelpText(*command, "tovicli", 27), "Usage:\n"
                                                        "  tovicli add --name TEXT\n"
                                                        "      --size NUMBER\n"
                                                        "      [TEXT...]\n"
                                                        "\n"
                                                        "Options:\n"
                                                        "      --name TEXT    Required.\n"
                                                        "      --size NUMBER  Required.\n"
                                                        "      --word TEXT    May be repeated. The\n"
                                                        "                     name may be left\n"
                                                        "                     out.\n");
}

TEST(Help, GeneratedWithoutSettingsHasDefaults) {
    auto const command = providerAdd();
    auto const output = CallSpec::Output::New();
    command->GenerateHelpOutput(nullptr, output);
    auto const text = boost::dynamic_pointer_cast<MetaObj::MetaString>(output->GetResult());
    ASSERT_NE(text, nullptr);
    EXPECT_TRUE(output->IsComplete());
    EXPECT_NE(text->GetValue().find("tovicli"), std::string::npos);
}

TEST(Help, NamespaceListsWhatItHolds) {
    auto const root = AutoCli::Namespace::New();
    auto const storage = AutoCli::Namespace::New();
    storage->SetDescription("Storage commands.");
    storage->RegisterNamespaceNode(providerAdd(), "add");
    storage->RegisterNamespaceNode(AutoCli::Namespace::New(), "rule");
    root->RegisterNamespaceNode(storage, "storage");
    EXPECT_EQ(namespaceHelp(*storage, "tovicli", 80), "Usage:\n"
                                                      "  tovicli storage COMMAND [options]\n"
                                                      "\n"
                                                      "Storage commands.\n"
                                                      "\n"
                                                      "Namespaces:\n"
                                                      "  rule\n"
                                                      "\n"
                                                      "Commands:\n"
                                                      "  add  Add a new provider.\n");
}

} // namespace
