// SPDX-License-Identifier: Apache-2.0
//
// What the tool says of the real commands: examples that work, and pages that say what help says.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sstream>

#include "CommandLine.h"
#include "DeclaredTree.h"
#include "Examples.h"
#include "Help.h"
#include "Pages.h"
#include "Roff.h"
#include "plexa/Declaration.h"

namespace {

using namespace Tovicli;
using namespace Tovicli::Manual;
using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::Not;

DeclaredTree realTree() {
    return DeclaredTree({TEST_LIBRARIES, TEST_LUMO_PLUGIN, TEST_CLI_LIBRARY});
}

/// As a shell breaks a line of ours: no example needs quotes.
std::vector<std::string> wordsOf(std::vector<std::string> const &pieces) {
    std::vector<std::string> words;
    for (std::string const &piece : pieces) {
        EXPECT_THAT(piece, Not(HasSubstr("'")));
        EXPECT_THAT(piece, Not(HasSubstr("\"")));
        std::istringstream stream(piece);
        for (std::string word; stream >> word;) {
            words.push_back(word);
        }
    }
    return words;
}

TEST(Manual, EveryCommandHasAnExampleAndEachIsAValidCommandLine) {
    DeclaredTree const tree = realTree();
    std::size_t commands = 0;
    for (auto const &command : tree.commands()) {
        ++commands;
        std::vector<Example> const examples = examplesOf(*command, "tovicli");
        EXPECT_FALSE(examples.empty()) << command->GetPathString(' ');
        for (Example const &example : examples) {
            EXPECT_NE(example.purpose, "");
            std::vector<std::string> words = wordsOf(example.pieces);
            ASSERT_EQ(words.front(), "tovicli");
            words.erase(words.begin());
            Misread misread;
            CommandLine const line = readCommandLine(tree.root(), words, misread);
            EXPECT_EQ(misread.sentence, "") << command->GetPathString(' ');
            EXPECT_EQ(line.node, command);
        }
    }
    EXPECT_GE(commands, 22U);
}

TEST(Manual, NoExampleIsKeptForACommandThatIsNoMore) {
    DeclaredTree const tree = realTree();
    std::vector<std::string> paths;
    for (auto const &command : tree.commands()) {
        paths.push_back(command->GetPathString(' '));
    }
    for (std::string const &kept : pathsWithExamples()) {
        EXPECT_THAT(paths, Contains(kept));
    }
}

TEST(Manual, PageAndHelpTellTheWholeDeclaration) {
    DeclaredTree const tree = realTree();
    for (auto const &command : tree.commands()) {
        std::string const page = commandPage(*command, {}, "1.0");
        std::string const help = helpOf(*command, "tovicli", 1000);
        for (Plexa::DeclaredOption const &option : Plexa::declaredOptions(*command)) {
            std::string const told = option.notes() + option.description;
            std::string const alias = option.alias.empty() ? "" : bold(option.alias) + ", ";
            std::string const value = option.value.empty() ? "" : " " + italic(option.value);
            EXPECT_THAT(page, HasSubstr(".TP\n" + alias + bold(option.name) + value + "\n" + roff(told) + "\n"));
            EXPECT_THAT(help, HasSubstr((option.alias.empty() ? "    " : option.alias + ", ") + option.form()));
            EXPECT_THAT(help, HasSubstr(told));
        }
        for (Plexa::DeclaredField const &field : Plexa::declaredResult(*command).fields) {
            EXPECT_THAT(page, HasSubstr(".TP\n" + bold(field.name) + "\n" + roff(field.kind) + "\n"));
            EXPECT_THAT(help, HasSubstr("\n  " + std::string(2 * field.depth, ' ') + field.name + " "));
        }
    }
}

TEST(Manual, NothingIsTakenForARequestOrAnEscape) {
    EXPECT_EQ(roff(".TH a\n'x\n-a \\n ~^`"), "\\&.TH a\n\\&\\(aqx\n\\-a \\en \\(ti\\(ha\\(ga");
    EXPECT_EQ(verbatim("a\n.b"), ".EX\na\n\\&.b\n.EE\n");
    EXPECT_EQ(bold("-a"), "\\fB\\-a\\fR");
}

TEST(Manual, ACommandThatIsOnlyDeclaredCannotReachTheTool) {
    DeclaredTree const tree = realTree();
    Misread misread;
    CommandLine const line = readCommandLine(tree.root(), {"cli", "command", "list"}, misread);
    auto const command = boost::dynamic_pointer_cast<Plexa::AutoCli::Command>(line.node);
    ASSERT_NE(command, nullptr);
    EXPECT_THROW(command->Execute(line.input, Plexa::CallSpec::Output::New()), std::exception);
}

} // namespace
