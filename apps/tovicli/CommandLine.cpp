// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"

#include "plexa/OptionParser.h"
#include "plexa/UsageError.h"

namespace Tovicli {

using namespace Plexa;

namespace {

using Node = boost::shared_ptr<AutoCli::NamespaceNode>;

std::string whatThereIs(std::vector<std::string> const &names) {
    std::string text;
    for (std::string const &name : names) {
        text += (text.empty() ? "; there is " : ", ") + name;
    }
    return text;
}

/// Paths below a node that end in the word: the user may have left out what leads there.
void findDeeper(AutoCli::NamespaceNode &node, std::string const &word, std::vector<std::string> &paths) {
    constexpr std::size_t most = 3;
    for (auto const &child : node.GetNamespaceNodes()) {
        if (child->GetName() == word && paths.size() < most) {
            paths.push_back(child->GetPathString(' '));
        }
        findDeeper(*child, word, paths);
    }
}

std::string unknownWordSentence(AutoCli::NamespaceNode &node, std::string const &word) {
    std::string const path = node.GetPathString(' ');
    std::vector<std::string> const names = node.GetNamespaceNodeNames();
    std::string near = didYouMean(nearNames(word, names));
    if (near.empty()) {
        std::vector<std::string> deeper;
        findDeeper(node, word, deeper);
        near = didYouMean(deeper);
    }
    return "unknown word " + shownWord(word) + (path.empty() ? "" : " in '" + path + "'") +
           (near.empty() ? whatThereIs(names) : near);
}

std::string strayWordSentence(CallSpec::InputSpec const &spec, std::string const &word) {
    std::vector<std::string> names;
    for (auto const &parameter : spec.GetParameters()) {
        names.push_back("--" + parameter->GetName());
    }
    return "unexpected word " + shownWord(word) + ", an option is expected" + didYouMean(nearNames("--" + word, names));
}

/// Follows words and global options down to a command, or as far as they lead.
/// @return the position of the first word behind the command, or the end
std::size_t walk(Node &node, std::vector<std::string> const &words, OptionParser &globals, Misread &misread) {
    std::size_t position = 0;
    while (position < words.size() && node->GetType() != "command") {
        if (OptionParser::looksLikeOption(words[position])) {
            globals.take(words, position);
            continue;
        }
        Node const child = node->GetNamespaceNode(words[position]);
        if (child == nullptr) {
            misread.unknownWord = true;
            throw UsageError(unknownWordSentence(*node, words[position]));
        }
        node = child;
        ++position;
    }
    return position;
}

/// Reads what stands behind a command.
/// @param positional the parameter that words without an option are values of; empty when they are mistakes
void readOptions(std::vector<std::string> const &words, std::size_t position, CallSpec::InputSpec const &spec,
                 std::string const &positional, OptionParser &own, OptionParser &globals) {
    while (position < words.size()) {
        if (!OptionParser::looksLikeOption(words[position])) {
            if (positional.empty()) {
                throw UsageError(strayWordSentence(spec, words[position]));
            }
            std::size_t first = 0;
            own.take({"--" + positional + "=" + words[position]}, first);
            ++position;
            continue;
        }
        // An option that neither knows is reported with the names of the command, which are what was meant.
        bool const isGlobal = !own.knows(words[position]) && globals.knows(words[position]);
        (isGlobal ? globals : own).take(words, position);
    }
}

} // namespace

CommandLine readCommandLine(Node const &root, std::vector<std::string> const &words, Misread &misread) {
    CommandLine line{root, CallSpec::Input::New(), CallSpec::Input::New()};
    OptionParser globals({{globalOptions(), line.global}});
    try {
        std::size_t const position = walk(line.node, words, globals, misread);
        if (auto const command = boost::dynamic_pointer_cast<AutoCli::Command>(line.node)) {
            OptionParser::Group group{command->GetInputSpec(), line.input};
            if (group.spec == nullptr) {
                group.spec = CallSpec::InputSpec::New();
            }
            OptionParser own({group});
            own.alsoSuggest(globals);
            readOptions(words, position, *group.spec, command->GetMetaDataField("positional"), own, globals);
            own.finish();
            if (!line.global->GetBool("help") && !line.global->GetBool("version")) {
                OptionParser::requireAll(group);
            }
        }
        globals.finish();
    } catch (UsageError const &mistake) {
        misread.node = line.node;
        misread.sentence = mistake.sentence();
    }
    return line;
}

FirstReading readAhead(std::vector<std::string> const &words) {
    FirstReading reading{CallSpec::Input::New(), CallSpec::Input::New(), 0};
    OptionParser certain({{globalOptions(), reading.certain}});
    OptionParser probable({{globalOptions(), reading.probable}});
    std::size_t position = 0;
    while (position < words.size() && OptionParser::looksLikeOption(words[position])) {
        std::size_t again = position;
        certain.take(words, position);
        probable.take(words, again);
    }
    certain.finish();
    reading.pathAt = position;
    while (position < words.size()) {
        std::size_t const option = position;
        try {
            if (probable.knows(words[option])) {
                probable.take(words, position);
                continue;
            }
        } catch (UsageError const &) {
            // Not for us to say: a command may declare the name and take this value.
        }
        position = option + 1;
    }
    probable.finish();
    return reading;
}

} // namespace Tovicli
