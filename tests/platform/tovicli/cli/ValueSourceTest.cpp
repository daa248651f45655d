// SPDX-License-Identifier: Apache-2.0
//
// The table of value sources against what is really declared, and against what the daemon takes.
#include <algorithm>
#include <cstdlib>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include "Commands.h"
#include "FaultNames.h"
#include "PluginLoader.h"
#include "completion/ValueSource.h"

namespace {

using namespace Plexa;
using namespace Tovicli;
using namespace Tovicli::Cli;
using ::testing::IsEmpty;
using ::testing::UnorderedElementsAreArray;

/// The commands of the real plug-in.
class ValueSources : public ::testing::Test {
protected:
    ValueSources() {
        setenv("TOVI_OFFLINE", "1", 1);
        root->SubNamespace("storage");
        EXPECT_THAT(loader.registerInto(root, TEST_REAL_PLUGINS, environment).troubles, IsEmpty());
        commands = commandsBelow(*root);
    }
    ~ValueSources() override {
        unsetenv("TOVI_OFFLINE");
    }

    bool declares(KnownCommand const &known, std::string const &parameter) const {
        auto const parameters = known.command->GetInputSpec()->GetParameters();
        return std::any_of(parameters.begin(), parameters.end(),
                           [&parameter](auto const &each) { return each->GetName() == parameter; });
    }

    PluginLoader loader{TEST_LIBRARIES, geteuid()}; // first: what the tree holds must go before it
    ProcessEnvironment environment;
    boost::shared_ptr<AutoCli::Namespace> root = AutoCli::Namespace::New();
    std::vector<KnownCommand> commands;
};

TEST_F(ValueSources, EveryRowNamesAParameterThatIsDeclared) {
    ASSERT_EQ(commands.size(), 22U);
    for (SourceRow const &row : sourceTable()) {
        if (row.path.empty()) {
            auto const options = globalOptions()->GetParameters();
            EXPECT_TRUE(std::any_of(options.begin(), options.end(), [&row](auto const &option) {
                return option->GetName() == row.parameter;
            })) << row.parameter;
        } else if (!row.path.starts_with("cli ")) {
            EXPECT_TRUE(std::any_of(commands.begin(), commands.end(),
                                    [&](KnownCommand const &known) {
                                        return (row.path == "*" || row.path == known.path) &&
                                               declares(known, row.parameter);
                                    }))
                << row.path << " --" << row.parameter;
        }
    }
}

TEST_F(ValueSources, EveryCommandIsThePluginsThatItCameFrom) {
    for (KnownCommand const &known : commands) {
        EXPECT_EQ(known.plugin, "liblumointernal.so") << known.path;
    }
}

TEST_F(ValueSources, FaultsAndOperationsAreThoseOfTheDaemon) {
    std::vector<std::string> faults;
    for (std::size_t i = 0; i < Lumod::faultCount; ++i) {
        faults.emplace_back(Lumod::nameOf(static_cast<Lumod::Fault>(i)));
    }
    std::vector<std::string> operations{"*"};
    for (std::size_t i = 0; i < Lumod::operationCount; ++i) {
        operations.emplace_back(Lumod::nameOf(static_cast<Lumod::Operation>(i)));
    }
    std::string const rule = "storage internal lumo faultInjection rule add";
    EXPECT_THAT(sourceOf(rule, *CallSpec::ParameterSpec::New("fault", CallSpec::String)).words,
                UnorderedElementsAreArray(faults));
    EXPECT_THAT(sourceOf(rule, *CallSpec::ParameterSpec::New("operation", CallSpec::String)).words,
                UnorderedElementsAreArray(operations));
}

TEST_F(ValueSources, ANewProvidersNameIsNotThatOfAnother) {
    auto const name = CallSpec::ParameterSpec::New("vp-name", CallSpec::String);
    EXPECT_EQ(sourceOf("storage internal lumo orkaprovider add", *name).kind, ValueSource::Kind::Text);
    EXPECT_EQ(sourceOf("storage internal lumo orkaprovider remove", *name).kind, ValueSource::Kind::Live);
}

} // namespace
