// SPDX-License-Identifier: Apache-2.0
//
// Every command class against the table of declarations: what its constructor sets, its parameters, its result's
// schema, and the session that it may hold.
#include "Declarations.h"

#include <boost/pointer_cast.hpp>

#include "CommandTest.h"

namespace PluginTest {

std::vector<Declaration> allDeclarations() {
    std::vector<Declaration> all = providerDeclarations();
    for (auto const &more : {containerDeclarations(), daemonDeclarations(), groupDeclarations()}) {
        all.insert(all.end(), more.begin(), more.end());
    }
    return all;
}

} // namespace PluginTest

using namespace PluginTest;

namespace {

std::string kind(Plexa::CallSpec::ParameterType type) {
    static char const *const kinds[] = {"string", "integer", "boolean", "flag", "strings", "integers", "booleans"};
    return kinds[type];
}

std::vector<std::string> parametersOf(Plexa::CallSpec::InputSpec const &spec) {
    std::vector<std::string> lines;
    for (auto const &parameter : spec.GetParameters()) {
        std::string const alias = parameter->GetAlias().empty() ? "-" : parameter->GetAlias();
        lines.push_back(parameter->GetName() + " " + alias + " " + kind(parameter->GetType()) +
                        (parameter->IsRequired() ? " required: " : " optional: ") + parameter->GetDescription());
    }
    return lines;
}

class CommandClass : public CommandTest, public testing::WithParamInterface<Declaration> {};

TEST_P(CommandClass, SetsItsDescriptionMetadataAndFormatter) {
    auto const command = GetParam().make();
    using Pairs = std::vector<std::pair<std::string, std::string>>;
    EXPECT_EQ(command->GetDescription(), GetParam().description);
    EXPECT_EQ(command->GetMetaData(), (Pairs{{"type", GetParam().type}}));
    EXPECT_EQ(command->GetDefaultOutputFormatter(), GetParam().formatter);
    EXPECT_EQ(command->GetDefaultOutputFormatParameters(), GetParam().formatParameters);
    EXPECT_TRUE(command->GetExamples().empty());
    EXPECT_EQ(command->GetName(), "");
    EXPECT_EQ(command->GetType(), "command");
}

TEST_P(CommandClass, DeclaresItsParametersInOrder) {
    auto const command = GetParam().make();
    EXPECT_EQ(parametersOf(*command->GetInputSpecInternal()), GetParam().parameters);
    EXPECT_EQ(parametersOf(*command->GetInputSpec()), GetParam().parameters);
}

TEST_P(CommandClass, DeclaresItsResult) {
    auto const command = GetParam().make();
    EXPECT_EQ(Doubles::describe(command->GetOutputSpecInternal()->GetOutputType()), GetParam().result);
    EXPECT_EQ(Doubles::describe(command->GetOutputSpec()->GetOutputType()), GetParam().result);
}

TEST_P(CommandClass, MakesFreshInputAndOutputSpecsEachTime) {
    auto const command = GetParam().make();
    EXPECT_NE(command->GetInputSpecInternal(), command->GetInputSpecInternal());
    EXPECT_NE(command->GetOutputSpecInternal()->GetOutputType(), command->GetOutputSpecInternal()->GetOutputType());
}

TEST_P(CommandClass, MakesAFreshObjectThatKnowsItself) {
    auto const command = GetParam().make();
    EXPECT_NE(command, GetParam().make());
    EXPECT_EQ(command->GetThis().get(), boost::static_pointer_cast<Plexa::AutoCli::NamespaceNode>(command).get());
}

TEST_P(CommandClass, HoldsASessionFromConstructionToDestructionOrNone) {
    int const held = GetParam().sessionLine == 0 ? 0 : 1;
    auto command = GetParam().make();
    EXPECT_EQ(lumo.openSessions, held);
    command->GetInputSpecInternal();
    command->GetOutputSpecInternal();
    auto second = GetParam().make();
    EXPECT_EQ(lumo.openSessions, 2 * held);
    second.reset();
    EXPECT_EQ(lumo.openSessions, held);
    command.reset();
    EXPECT_EQ(lumo.openSessions, 0);
    EXPECT_EQ(log.count("LumoLib_Init(0, 0)"), static_cast<std::size_t>(2 * held));
    EXPECT_EQ(log.lines().size(), static_cast<std::size_t>(4 * held)) << "nothing but sessions";
}

TEST_P(CommandClass, CannotBeMadeWithoutItsSession) {
    lumo.init.always(false);
    if (GetParam().sessionLine == 0) {
        EXPECT_NO_THROW(GetParam().make());
        EXPECT_THAT(log.lines(), IsEmpty());
        return;
    }
    expectNoSession([&] { GetParam().make(); }, GetParam().className, GetParam().sessionLine);
    EXPECT_THAT(log.lines(), ElementsAre("LumoLib_Init(0, 0)")) << "what was not opened is not closed";
}

INSTANTIATE_TEST_SUITE_P(, CommandClass, testing::ValuesIn(allDeclarations()),
                         [](auto const &declaration) { return declaration.param.className; });

TEST(CommandClasses, AreTwentySevenOfWhichTwentyTwoAreInTheTree) {
    auto const all = allDeclarations();
    EXPECT_EQ(all.size(), 27U);
    EXPECT_EQ(std::count_if(all.begin(), all.end(), [](auto const &each) { return !each.path.empty(); }), 22);
    EXPECT_EQ(std::count_if(all.begin(), all.end(), [](auto const &each) { return each.sessionLine != 0; }), 11);
}

} // namespace
