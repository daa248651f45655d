// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <stdexcept>

#include "SampleCommand.h"

namespace {

using namespace Plexa::AutoCli;
using Words = std::vector<std::string>;

struct Tree {
    boost::shared_ptr<Namespace> root = Namespace::New();
    boost::shared_ptr<Namespace> storage = Namespace::New();
    boost::shared_ptr<Namespace> internal = Namespace::New();
    boost::shared_ptr<SampleCommand> load = SampleCommand::New();

    Tree() {
        root->SetName("root");
        storage->RegisterNamespaceNode(internal, "internal");
        root->RegisterNamespaceNode(storage, "storage");
        internal->RegisterNamespaceNode(load, "load");
    }
};

TEST(Tree, PathLeavesTheRootOutAlsoWhenItHasAName) {
    Tree tree;
    EXPECT_EQ(tree.load->GetPath(), (Words{"storage", "internal", "load"}));
    EXPECT_EQ(tree.load->GetPathString('.'), "storage.internal.load");
    EXPECT_TRUE(tree.root->GetPath().empty());
    EXPECT_EQ(tree.root->GetPathString(' '), "");
}

TEST(Tree, UnregisteredNodeHasNeitherNameNorPath) {
    auto const node = Namespace::New();
    EXPECT_EQ(node->GetName(), "");
    EXPECT_TRUE(node->GetPath().empty());
    EXPECT_EQ(node->GetParent(), nullptr);
}

TEST(Tree, ChildrenKeepRegistrationOrder) {
    Tree tree;
    tree.internal->RegisterNamespaceNode(Namespace::New(), "zeta");
    tree.internal->RegisterNamespaceNode(Namespace::New(), "alpha");
    EXPECT_EQ(tree.internal->GetNamespaceNodeNames(), (Words{"load", "zeta", "alpha"}));
    EXPECT_EQ(tree.internal->GetNamespaceNodes().size(), 3U);
    EXPECT_EQ(tree.internal->GetNamespaceNodes()[0], tree.load);
    EXPECT_TRUE(tree.internal->HasNamespaceNode("alpha"));
    EXPECT_FALSE(tree.internal->HasNamespaceNode("beta"));
    EXPECT_EQ(tree.internal->GetNamespaceNode("beta"), nullptr);
}

TEST(Tree, RefusesTakenAndEmptyNamesAndEmptyNodesUnchanged) {
    Tree tree;
    auto const another = Namespace::New();
    EXPECT_THROW(tree.root->RegisterNamespaceNode(another, "storage"), std::invalid_argument);
    EXPECT_THROW(tree.root->RegisterNamespaceNode(another, ""), std::invalid_argument);
    EXPECT_THROW(tree.root->RegisterNamespaceNode(nullptr, "empty"), std::invalid_argument);
    EXPECT_EQ(tree.root->GetNamespaceNodeNames(), (Words{"storage"}));
    EXPECT_EQ(another->GetName(), "");
    EXPECT_EQ(another->GetParent(), nullptr);
}

TEST(Tree, RefusesCyclesAndASecondPlace) {
    Tree tree;
    EXPECT_THROW(tree.internal->RegisterNamespaceNode(tree.root, "root"), std::invalid_argument);
    EXPECT_THROW(tree.root->RegisterNamespaceNode(tree.root, "self"), std::invalid_argument);
    EXPECT_THROW(tree.root->RegisterNamespaceNode(tree.load, "again"), std::invalid_argument);
    EXPECT_EQ(tree.load->GetPathString(' '), "storage internal load");
}

TEST(Tree, ResolvesAsFarAsWordsNameChildren) {
    Tree tree;
    std::size_t consumed = 99;
    EXPECT_EQ(tree.root->ResolveNode({"storage", "internal", "load", "--x"}, consumed), tree.load);
    EXPECT_EQ(consumed, 3U);
    EXPECT_EQ(tree.root->ResolveNode({"storage", "other"}, consumed), tree.storage);
    EXPECT_EQ(consumed, 1U);
    EXPECT_EQ(tree.root->ResolveNode({"other"}, consumed), tree.root);
    EXPECT_EQ(consumed, 0U);
    EXPECT_EQ(tree.load->ResolveNode({"storage"}, consumed), tree.load);
    EXPECT_EQ(consumed, 0U);
}

TEST(Tree, SubNamespaceFindsOrMakes) {
    Tree tree;
    EXPECT_EQ(tree.root->SubNamespace("storage"), tree.storage);
    auto const made = tree.root->SubNamespace("network");
    EXPECT_EQ(made->GetPathString(' '), "network");
    EXPECT_THROW(tree.internal->SubNamespace("load"), std::invalid_argument);
}

TEST(Tree, OwnsChildrenAndKnowsParentsWeakly) {
    auto const child = Namespace::New();
    {
        auto const parent = Namespace::New();
        parent->RegisterNamespaceNode(child, "child");
        EXPECT_EQ(child->GetParent(), parent);
    }
    EXPECT_EQ(child->GetParent(), nullptr);
}

TEST(Tree, CommandIsALeafThatCanBeCalled) {
    Tree tree;
    EXPECT_EQ(tree.load->GetType(), "command");
    EXPECT_EQ(tree.storage->GetType(), "namespace");
    EXPECT_FALSE(tree.load->HasNamespaceNode("x"));
    EXPECT_EQ(tree.load->GetNamespaceNode("x"), nullptr);
    EXPECT_THROW(tree.load->RegisterNamespaceNode(Namespace::New(), "x"), std::invalid_argument);
    EXPECT_EQ(tree.load->GetThis(), tree.load);
    EXPECT_FALSE(tree.storage->GetDispatcher());
    auto const output = Plexa::CallSpec::Output::New();
    tree.load->GetDispatcher()(Plexa::CallSpec::Input::New(), output);
    EXPECT_EQ(tree.load->executions, 1);
}

TEST(Tree, CommandSettingsKeepTheirOrder) {
    auto const command = SampleCommand::New();
    command->SetDefaultOutputParameter("b", "1");
    command->SetDefaultOutputParameter("a", "2");
    command->SetDefaultOutputParameter("b", "3");
    using Pairs = std::vector<std::pair<std::string, std::string>>;
    EXPECT_EQ(command->GetDefaultOutputFormatParameters(), (Pairs{{"b", "3"}, {"a", "2"}}));
    command->SetMetaDataField("type", "operation");
    EXPECT_EQ(command->GetMetaDataField("type"), "operation");
    EXPECT_EQ(command->GetMetaDataField("other"), "");
    EXPECT_EQ(command->GetMetaData(), (Pairs{{"type", "operation"}}));
    EXPECT_EQ(command->GetDefaultOutputFormatter(), "");
    command->SetDefaultOutputFormatter("table");
    EXPECT_EQ(command->GetDefaultOutputFormatter(), "table");
    command->AddExample("load", "Loads.");
    EXPECT_EQ(command->GetExamples(), (Pairs{{"load", "Loads."}}));
}

} // namespace
