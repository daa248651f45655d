// SPDX-License-Identifier: Apache-2.0
//
// Words in; the node, the command's values and the tool's own, or the sentence of the mistake, out.
#include <gtest/gtest.h>

#include "CommandLine.h"
#include "SampleCommand.h"

namespace {

using namespace Plexa;
using namespace Tovicli;

boost::shared_ptr<AutoCli::Namespace> tree() {
    auto const command = SampleCommand::New();
    command->parameter("name", CallSpec::String, "n")->SetRequired(true);
    command->parameter("priority", CallSpec::IntList, "p");
    command->parameter("fields", CallSpec::Flag);
    auto const root = AutoCli::Namespace::New();
    root->SubNamespace("storage")->SubNamespace("internal")->RegisterNamespaceNode(command, "add");
    return root;
}

std::string readAs(std::vector<std::string> const &words) {
    auto const root = tree();
    Misread misread;
    CommandLine const line = readCommandLine(root, words, misread);
    if (!misread.sentence.empty()) {
        return std::string(misread.unknownWord ? "word: " : "option: ") + misread.sentence;
    }
    std::string text = line.node->GetPathString(' ');
    if (line.input->HasParameter("name")) {
        text += " name=" + line.input->GetString("name");
    }
    for (int64_t const number : line.input->GetIntList("priority")) {
        text += " priority=" + std::to_string(number);
    }
    if (line.input->GetBool("fields")) {
        text += " fields";
    }
    for (char const *global : {"format", "fields", "root"}) {
        if (line.global->HasParameter(global)) {
            text += std::string(" global ") + global + "=" + line.global->GetString(global);
        }
    }
    return line.global->GetBool("help") ? text + " help" : text;
}

struct Case {
    std::vector<std::string> words;
    std::string expected;
};

TEST(CommandLine, IsReadAgainstTheTree) {
    Case const cases[] = {
        {{}, ""},
        {{"storage"}, "storage"},
        {{"storage", "internal", "add", "-n", "x"}, "storage internal add name=x"},
        {{"--format", "json", "storage", "internal", "add", "-n", "x"},
         "storage internal add name=x global format=json"},
        {{"storage", "--format=json", "internal", "add", "-n", "x"}, "storage internal add name=x global format=json"},
        {{"storage", "internal", "add", "-n", "x", "--format", "json"},
         "storage internal add name=x global format=json"},
        {{"storage", "internal", "add", "--fields", "-n", "x"}, "storage internal add name=x fields"},
        {{"--fields", "a,b", "storage", "internal", "add", "--fields", "-n", "x"},
         "storage internal add name=x fields global fields=a,b"},
        {{"storage", "internal", "add", "-p", "-1", "-p", "2", "-n", "add"},
         "storage internal add name=add priority=-1 priority=2"},
        {{"storage", "internal", "add", "--help"}, "storage internal add help"},
        {{"--help", "storage", "internal", "add"}, "storage internal add help"},
        {{"storage", "-h"}, "storage help"},
        {{"--root", "storage", "storage"}, "storage global root=storage"},
    };
    for (Case const &each : cases) {
        EXPECT_EQ(readAs(each.words), each.expected);
    }
}

TEST(CommandLine, MistakesSayWhatIsNear) {
    Case const cases[] = {
        {{"stroage"}, "word: unknown word 'stroage'; did you mean 'storage'?"},
        {{"storage", "intenral"}, "word: unknown word 'intenral' in 'storage'; did you mean 'internal'?"},
        {{"storage", "internal", "remove"}, "word: unknown word 'remove' in 'storage internal'; there is add"},
        {{"storage", ""}, "word: unknown word '' in 'storage'; there is internal"},
        {{"storage", "--name", "x"}, "option: unknown option '--name'"},
        {{"storage", "internal", "add"}, "option: missing required parameter: --name"},
        {{"storage", "internal", "add", "--nmae", "x"}, "option: unknown option '--nmae'; did you mean '--name'?"},
        {{"storage", "internal", "add", "name"},
         "option: unexpected word 'name', an option is expected; did you mean '--name'?"},
        {{"storage", "internal", "add", "-n", "x", "--formt", "json"},
         "option: unknown option '--formt'; did you mean '--format'?"},
        {{"storage", "internal", "add", "-n", "x", "--format", "a", "--format", "b"},
         "option: --format is given twice"},
        {{"storage", "-"}, "word: unknown word '-' in 'storage'; there is internal"},
    };
    for (Case const &each : cases) {
        EXPECT_EQ(readAs(each.words), each.expected);
    }
}

TEST(CommandLine, ReadingAheadTellsTheCertainFromTheProbable) {
    FirstReading const reading = readAhead({"--format", "json", "storage", "--name", "x", "--root=/r", "--timeout"});
    EXPECT_EQ(reading.certain->GetString("format"), "json");
    EXPECT_FALSE(reading.certain->HasParameter("root"));
    EXPECT_EQ(reading.probable->GetString("format"), "json");
    EXPECT_EQ(reading.probable->GetString("root"), "/r");
    EXPECT_FALSE(reading.probable->HasParameter("timeout"));
}

} // namespace
