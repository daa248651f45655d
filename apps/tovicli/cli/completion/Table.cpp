// SPDX-License-Identifier: Apache-2.0
#include <utility>

#include "Settings.h"
#include "completion/Scripts.h"
#include "plexa/Text.h"

namespace Tovicli::Cli {

using namespace Plexa;

namespace {

std::vector<OptionEntry> optionsOf(std::string const &path, CallSpec::InputSpec const &spec) {
    std::vector<OptionEntry> options;
    for (auto const &parameter : spec.GetParameters()) {
        CallSpec::ParameterType const type = parameter->GetType();
        bool const isList = type == CallSpec::StringList || type == CallSpec::IntList || type == CallSpec::BoolList;
        options.push_back({parameter->GetName(), parameter->GetAlias(), parameter->GetDescription(),
                           sourceOf(path, *parameter), isList});
    }
    return options;
}

void collect(AutoCli::NamespaceNode &node, std::vector<NodeEntry> &table) {
    NodeEntry entry;
    entry.path = node.GetPathString(' ');
    auto const command = boost::dynamic_pointer_cast<AutoCli::Command>(node.GetThis());
    entry.isCommand = command != nullptr;
    if (command != nullptr) {
        if (InputSpecPtr const spec = command->GetInputSpec()) {
            entry.options = optionsOf(entry.path, *spec);
        }
        for (OptionEntry const &option : entry.options) {
            if (option.name == command->GetMetaDataField("positional")) {
                entry.positional = option.source;
            }
        }
    } else if (node.GetParent() == nullptr) {
        entry.options = optionsOf({}, *globalOptions());
    }
    for (NodePtr const &child : node.GetNamespaceNodes()) {
        entry.children.emplace_back(child->GetName(), child->GetDescription());
    }
    table.push_back(std::move(entry));
    for (NodePtr const &child : node.GetNamespaceNodes()) {
        collect(*child, table);
    }
}

} // namespace

std::vector<NodeEntry> completionTable(AutoCli::NamespaceNode &root) {
    std::vector<NodeEntry> table;
    collect(root, table);
    return table;
}

std::string shellQuoted(std::string const &text) {
    std::string quoted = "'";
    for (char const c : escaped(text)) {
        quoted += c == '\'' ? std::string("'\\''") : std::string(1, c);
    }
    return quoted + "'";
}

std::string sourceText(ValueSource const &source) {
    switch (source.kind) {
    case ValueSource::Kind::Flag:
        return "flag";
    case ValueSource::Kind::Text:
        return "text";
    case ValueSource::Kind::Files:
        return "files";
    case ValueSource::Kind::Directories:
        return "directories";
    case ValueSource::Kind::Path:
        return "path";
    case ValueSource::Kind::Live:
        return "live";
    case ValueSource::Kind::Words:
        break;
    }
    std::string text = "words";
    for (std::string const &word : source.words) {
        text += ' ' + word;
    }
    return text;
}

} // namespace Tovicli::Cli
