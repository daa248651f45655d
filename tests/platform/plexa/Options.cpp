// SPDX-License-Identifier: Apache-2.0
//
// Words in, printed values or the sentence of the mistake out.
#include <gtest/gtest.h>

#include <boost/make_shared.hpp>

#include "plexa/OptionParser.h"
#include "plexa/UsageError.h"

namespace {

using namespace Plexa;
using CallSpec::ParameterType;

boost::shared_ptr<CallSpec::InputSpec> declaration() {
    auto const spec = CallSpec::InputSpec::New();
    auto const add = [&spec](char const *name, ParameterType type, char const *alias, bool required) {
        auto const parameter = CallSpec::ParameterSpec::New(name, type);
        parameter->SetAlias(alias);
        parameter->SetRequired(required);
        spec->AddParameter(parameter);
    };
    add("vp-name", CallSpec::String, "n", true);
    add("size", CallSpec::Int, "s", false);
    add("enabled", CallSpec::Bool, "e", false);
    add("clear", CallSpec::Flag, "c", false);
    add("arrayid", CallSpec::StringList, "a", false);
    add("priority", CallSpec::IntList, "p", false);
    add("isactive", CallSpec::BoolList, "i", true);
    return spec;
}

std::string printed(CallSpec::InputSpec const &spec, CallSpec::Input const &input) {
    std::string text;
    for (auto const &parameter : spec.GetParameters()) {
        std::string const name = parameter->GetName();
        if (!input.HasParameter(name)) {
            continue;
        }
        text += (text.empty() ? "" : " ") + name + "=";
        switch (parameter->GetType()) {
        case CallSpec::String:
            text += "'" + input.GetString(name) + "'";
            break;
        case CallSpec::Int:
            text += std::to_string(input.GetInt(name));
            break;
        case CallSpec::Bool:
        case CallSpec::Flag:
            text += input.GetBool(name) ? "true" : "false";
            break;
        case CallSpec::StringList:
            for (std::string const &value : input.GetStringList(name)) {
                text += "'" + value + "';";
            }
            break;
        case CallSpec::IntList:
            for (int64_t const value : input.GetIntList(name)) {
                text += std::to_string(value) + ";";
            }
            break;
        case CallSpec::BoolList:
            for (bool const value : input.GetBoolList(name)) {
                text += value ? "true;" : "false;";
            }
            break;
        }
    }
    return text;
}

std::string parsed(std::vector<std::string> const &words) {
    auto const spec = declaration();
    auto const input = CallSpec::Input::New();
    OptionParser parser({{spec, input}});
    try {
        std::size_t position = 0;
        while (position < words.size()) {
            parser.take(words, position);
        }
        parser.finish();
    } catch (UsageError const &mistake) {
        return mistake.sentence();
    }
    return printed(*spec, *input);
}

struct Case {
    std::vector<std::string> words;
    std::string expected;
};

TEST(Options, AreReadInEveryForm) {
    Case const cases[] = {
        {{}, ""},
        {{"--vp-name", "x"}, "vp-name='x'"},
        {{"--vp-name=x"}, "vp-name='x'"},
        {{"--vp-name=a=b"}, "vp-name='a=b'"},
        {{"-n", "x"}, "vp-name='x'"},
        {{"--vp-name", ""}, "vp-name=''"},
        {{"--vp-name="}, "vp-name=''"},
        {{"--clear"}, "clear=true"},
        {{"-c", "-n", "x"}, "vp-name='x' clear=true"},
        {{"--enabled", "TRUE"}, "enabled=true"},
        {{"--enabled", "False"}, "enabled=false"},
        {{"-s", "-1"}, "size=-1"},
        {{"-p", "-1", "-p", "7"}, "priority=-1;7;"},
        {{"--arrayid", "b", "--arrayid=a", "-a", "b"}, "arrayid='b';'a';'b';"},
        {{"-i", "true", "-i", "false"}, "isactive=true;false;"},
        {{"--vp-name", "--clear"}, "vp-name='--clear'"},
        {{"--vp-name", "-n"}, "vp-name='-n'"},
        {{"--size", "9223372036854775807"}, "size=9223372036854775807"},
        {{"--size", "-9223372036854775808"}, "size=-9223372036854775808"},
        {{"--vp-name", "Größe 金"}, "vp-name='Größe 金'"},
    };
    for (Case const &each : cases) {
        EXPECT_EQ(parsed(each.words), each.expected);
    }
}

TEST(Options, MistakesNameParameterValueAndExpectation) {
    Case const cases[] = {
        {{"--vp-nam", "x"}, "unknown option '--vp-nam'; did you mean '--vp-name'?"},
        {{"--bogus=x"}, "unknown option '--bogus'"},
        {{"-z"}, "unknown option '-z'"},
        {{"-nx"}, "unknown option '-nx'"},
        {{"-n=x"}, "unknown option '-n=x'"},
        {{"--"}, "unknown option '--'"},
        {{"--n", "x"}, "unknown option '--n'"},
        {{"-vp-name", "x"}, "unknown option '-vp-name'; did you mean '--vp-name'?"},
        {{"--vp-name"}, "--vp-name needs a value, a text is expected"},
        {{"-s"}, "--size needs a value, a whole number is expected"},
        {{"--enabled"}, "--enabled needs a value, true or false is expected"},
        {{"--clear=yes"}, "--clear takes no value, 'yes' was given"},
        {{"--enabled", "yes"}, "--enabled: 'yes' is not a boolean, true or false is expected"},
        {{"--enabled", ""}, "--enabled: '' is not a boolean, true or false is expected"},
        {{"--isactive", "1"}, "--isactive: '1' is not a boolean, true or false is expected"},
        {{"--size", "12MB"}, "--size: '12MB' is not a number, a whole number is expected"},
        {{"--size", ""}, "--size: '' is not a number, a whole number is expected"},
        {{"--size", " 1"}, "--size: ' 1' is not a number, a whole number is expected"},
        {{"--size", "1.5"}, "--size: '1.5' is not a number, a whole number is expected"},
    };
    for (Case const &each : cases) {
        EXPECT_EQ(parsed(each.words), each.expected);
    }
}

TEST(Options, fault_4_NumberOverflowNamesParameterAndValue) {
    std::string const range =
        " is out of range, a whole number from -9223372036854775808 to 9223372036854775807 is expected";
    EXPECT_EQ(parsed({"--size", "9223372036854775808"}), "--size: '9223372036854775808'" + range);
    EXPECT_EQ(parsed({"-p", "1", "-p", "-9223372036854775809"}), "--priority: '-9223372036854775809'" + range);
}

TEST(Options, fault_5_ScalarsMayBeGivenOnce) {
    EXPECT_EQ(parsed({"--vp-name", "x", "-n", "x"}), "--vp-name is given twice");
    EXPECT_EQ(parsed({"--size", "1", "--size", "2"}), "--size is given twice");
    EXPECT_EQ(parsed({"-c", "--clear"}), "--clear is given twice");
}

TEST(Options, AParameterWithoutAnAliasHasItsLongNameAlone) {
    auto const spec = CallSpec::InputSpec::New();
    spec->AddParameter(CallSpec::ParameterSpec::New("start-pe-apd", CallSpec::String));
    auto const input = CallSpec::Input::New();
    OptionParser parser({{spec, input}});
    for (char const *const word : {"-s", "-", "--", "--s", "-start-pe-apd"}) {
        EXPECT_FALSE(parser.knows(word)) << word;
    }
    std::vector<std::string> const words = {"--start-pe-apd", "naa.1"};
    std::size_t position = 0;
    parser.take(words, position);
    EXPECT_EQ(input->GetString("start-pe-apd"), "naa.1");
}

TEST(Options, MissingRequiredParametersAreAllNamed) {
    auto const spec = declaration();
    auto const input = CallSpec::Input::New();
    auto const sentence = [&] {
        try {
            OptionParser::requireAll({spec, input});
        } catch (UsageError const &mistake) {
            return mistake.sentence();
        }
        return std::string("none missing");
    };
    EXPECT_EQ(sentence(), "missing required parameters: --vp-name, --isactive");
    input->SetBoolList("isactive", {true});
    EXPECT_EQ(sentence(), "missing required parameter: --vp-name");
    input->SetString("vp-name", "");
    EXPECT_EQ(sentence(), "none missing");
}

TEST(Options, TheFirstGroupThatDeclaresANameHasIt) {
    auto const second = CallSpec::InputSpec::New();
    second->AddParameter(CallSpec::ParameterSpec::New("size", CallSpec::String));
    second->AddParameter(CallSpec::ParameterSpec::New("format", CallSpec::String));
    auto const first = CallSpec::Input::New();
    auto const other = CallSpec::Input::New();
    OptionParser parser({{declaration(), first}, {second, other}});
    std::vector<std::string> const words = {"--size", "1", "--format", "json"};
    std::size_t position = 0;
    parser.take(words, position);
    parser.take(words, position);
    EXPECT_EQ(first->GetInt("size"), 1);
    EXPECT_FALSE(other->HasParameter("size"));
    EXPECT_EQ(other->GetString("format"), "json");
}

TEST(Options, WordsThatAreNoOptionsAreNotKnown) {
    OptionParser const parser({{declaration(), CallSpec::Input::New()}});
    EXPECT_TRUE(parser.knows("-c"));
    EXPECT_TRUE(parser.knows("--clear=no"));
    EXPECT_FALSE(parser.knows(""));
    EXPECT_FALSE(parser.knows("-"));
    EXPECT_FALSE(parser.knows("--"));
    EXPECT_FALSE(parser.knows("xc"));
}

TEST(Options, ManyValuesOfAListAreReadInOnePass) {
    std::vector<std::string> words;
    for (int i = 0; i < 50000; ++i) {
        words.push_back("-p");
        words.push_back(std::to_string(i));
    }
    auto const spec = declaration();
    auto const input = CallSpec::Input::New();
    OptionParser parser({{spec, input}});
    std::size_t position = 0;
    while (position < words.size()) {
        parser.take(words, position);
    }
    parser.finish();
    EXPECT_EQ(input->GetIntList("priority").size(), 50000U);
    EXPECT_EQ(input->GetIntList("priority").back(), 49999);
}

} // namespace
