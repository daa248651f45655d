// SPDX-License-Identifier: Apache-2.0
//
// Command lines, one word a line of the input, read against the tree that the tool has: the plug-in's commands, and two
// that declare what those do not (every type of parameter, words without an option).
#include <string>
#include <vector>

#include <boost/make_shared.hpp>

#include "CommandLine.h"
#include "Property.h"
#include "plexa/UsageError.h"

namespace {

using namespace Plexa;
using Fuzz::require;
using Node = boost::shared_ptr<AutoCli::NamespaceNode>;
using Words = std::vector<std::string>;

/// A command with a parameter of each type, and words without an option as values of the last one.
class Sample : public virtual AutoCli::Command {
public:
    boost::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() override {
        auto const spec = CallSpec::InputSpec::New();
        for (CallSpec::ParameterType const type : {CallSpec::String, CallSpec::Int, CallSpec::Bool, CallSpec::Flag,
                                                   CallSpec::IntList, CallSpec::BoolList, CallSpec::StringList}) {
            auto const parameter = CallSpec::ParameterSpec::New("p" + std::to_string(type), type);
            parameter->SetAlias(std::string(1, static_cast<char>('a' + type)));
            parameter->SetRequired(type == CallSpec::String);
            spec->AddParameter(parameter);
        }
        return spec;
    }
    boost::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() override {
        return CallSpec::OutputSpec::New();
    }
    void ExecuteInternal(boost::shared_ptr<CallSpec::Input> const &,
                         boost::shared_ptr<CallSpec::Output> const &) override {}
};

Node const &tree() {
    static Node const root = [] {
        auto made = AutoCli::Namespace::New();
        made->RegisterNamespaceNode(AutoCli::Namespace::New(), "storage");
        AutoCli_RegisterNamespaces(made);
        made->RegisterNamespaceNode(boost::make_shared<Sample>(), "sample");
        auto const positional = boost::make_shared<Sample>();
        positional->SetMetaDataField("positional", "p4");
        made->RegisterNamespaceNode(positional, "positional");
        return made;
    }();
    return root;
}

Words wordsOf(std::string_view text) {
    Words words;
    while (!text.empty()) {
        std::size_t const end = text.find('\n');
        // What starts a process holds no NUL.
        words.emplace_back(text.substr(0, end).substr(0, text.find('\0')));
        text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
    }
    return words;
}

/// Says what was read, each value as --name=value: the words that mean the same as those that were read.
void append(Words &words, CallSpec::InputSpec const &spec, CallSpec::Input const &input) {
    for (auto const &parameter : spec.GetParameters()) {
        std::string const name = parameter->GetName();
        std::string const option = "--" + name + "=";
        if (!input.HasParameter(name)) {
            continue;
        }
        switch (parameter->GetType()) {
        case CallSpec::String:
            words.push_back(option + input.GetString(name));
            break;
        case CallSpec::Int:
            words.push_back(option + std::to_string(input.GetInt(name)));
            break;
        case CallSpec::Bool:
            words.push_back(option + (input.GetBool(name) ? "true" : "false"));
            break;
        case CallSpec::Flag:
            require(input.GetBool(name), "a flag that is given is true", name);
            words.push_back("--" + name);
            break;
        case CallSpec::StringList:
            for (std::string const &text : input.GetStringList(name)) {
                words.push_back(option + text);
            }
            break;
        case CallSpec::IntList:
            for (int64_t const number : input.GetIntList(name)) {
                words.push_back(option + std::to_string(number));
            }
            break;
        case CallSpec::BoolList:
            for (bool const truth : input.GetBoolList(name)) {
                words.push_back(option + (truth ? "true" : "false"));
            }
            break;
        }
    }
}

/// The words that mean what a reading says.
Words wordsOf(Tovicli::CommandLine const &line) {
    Words words;
    append(words, *Tovicli::globalOptions(), *line.global);
    Words const path = line.node->GetPath();
    words.insert(words.end(), path.begin(), path.end());
    if (auto const command = boost::dynamic_pointer_cast<AutoCli::Command>(line.node)) {
        append(words, *command->GetInputSpec(), *line.input);
    }
    return words;
}

void checkSettings(CallSpec::Input const &options) {
    try {
        Tovicli::Settings const settings = Tovicli::settingsFrom(options, nullptr, {"/plugins", "/work"});
        require(settings.timeoutMs > 0, "there is a timeout");
    } catch (UsageError const &mistake) {
        Fuzz::requireSentence(mistake.sentence());
    }
}

void checkReading(Words const &words, Tovicli::CommandLine const &line) {
    Words const again = wordsOf(line);
    Tovicli::Misread misread;
    Tovicli::CommandLine const second = Tovicli::readCommandLine(tree(), again, misread);
    require(misread.sentence.empty(), "what was read is read again", misread.sentence);
    require(second.node == line.node && wordsOf(second) == again, "what was read again says the same");
    checkSettings(*line.global);
    // What is read before the plug-ins are there is believed only as far as this reading bears it out.
    Tovicli::FirstReading const first = Tovicli::readAhead(words);
    Words certain;
    append(certain, *Tovicli::globalOptions(), *first.certain);
    for (std::string const &option : certain) {
        bool const isThere = std::find(again.begin(), again.end(), option) != again.end();
        require(isThere, "what is certain at first is what was meant", option);
    }
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int *, char ***) {
    setenv("TOVI_OFFLINE", "1", 1); // commands that open a session when they are made are given one
    tree();
    return 0;
}

int LLVMFuzzerTestOneInput(std::uint8_t const *data, std::size_t size) {
    Words const words = wordsOf(Fuzz::textOf(data, size));
    Tovicli::Misread misread;
    Tovicli::CommandLine const line = Tovicli::readCommandLine(tree(), words, misread);
    require(line.node != nullptr, "the words lead somewhere");
    if (misread.node == nullptr) {
        checkReading(words, line);
        return 0;
    }
    Fuzz::requireSentence(misread.sentence);
    try {
        Tovicli::readAhead(words);
    } catch (UsageError const &mistake) {
        Fuzz::requireSentence(mistake.sentence());
    }
    return 0;
}
