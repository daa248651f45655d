// SPDX-License-Identifier: Apache-2.0
#include "plexa/AutoCli.h"

#include <algorithm>
#include <stdexcept>

#include "CommandHelp.h"

namespace Plexa::AutoCli {

namespace {

/// Sets a key's value; a key that is there already keeps its place.
void setPair(std::vector<std::pair<std::string, std::string>> &pairs, std::string const &key,
             std::string const &value) {
    auto const found = std::find_if(pairs.begin(), pairs.end(), [&key](auto const &pair) { return pair.first == key; });
    if (found != pairs.end()) {
        found->second = value;
    } else {
        pairs.emplace_back(key, value);
    }
}

} // namespace

Command::Command() = default;

boost::shared_ptr<CallSpec::InputSpec> Command::GetInputSpec() {
    return GetInputSpecInternal();
}

boost::shared_ptr<CallSpec::OutputSpec> Command::GetOutputSpec() {
    return GetOutputSpecInternal();
}

void Command::Execute(boost::shared_ptr<CallSpec::Input> const &input,
                      boost::shared_ptr<CallSpec::Output> const &output) {
    ExecuteInternal(input, output);
}

boost::shared_ptr<NamespaceNode> Command::GetThis() {
    return NamespaceNode::GetThis();
}

bool Command::HasNamespaceNode(std::string const &) {
    return false;
}

boost::shared_ptr<NamespaceNode> Command::GetNamespaceNode(std::string const &) {
    return {};
}

void Command::RegisterNamespaceNode(boost::shared_ptr<NamespaceNode> const &, std::string const &name) {
    throw std::invalid_argument("cannot register '" + name + "' in '" + GetPathString(' ') +
                                "': a command holds no nodes");
}

boost::shared_ptr<NamespaceNode> Command::ResolveNode(std::vector<std::string> const &, std::size_t &consumed) {
    consumed = 0;
    return GetThis();
}

Dispatcher Command::GetDispatcher() {
    boost::shared_ptr<NamespaceNode> const keptAlive = GetThis();
    return [keptAlive, this](boost::shared_ptr<CallSpec::Input> const &input,
                             boost::shared_ptr<CallSpec::Output> const &output) { Execute(input, output); };
}

void Command::SetParent(boost::shared_ptr<NamespaceNode> const &parent) {
    NamespaceNode::SetParent(parent);
}

boost::shared_ptr<NamespaceNode> Command::GetParent() {
    return NamespaceNode::GetParent();
}

std::string Command::GetType() {
    return "command";
}

std::vector<std::pair<std::string, std::string>> Command::GetExamples() {
    return examples_;
}

std::vector<std::pair<std::string, std::string>> Command::GetDefaultOutputFormatParameters() {
    return formatParameters_;
}

void Command::SetDefaultOutputFormatter(std::string const &name) {
    defaultFormatter_ = name;
}

void Command::SetDefaultOutputParameter(std::string const &key, std::string const &value) {
    setPair(formatParameters_, key, value);
}

void Command::SetMetaDataField(std::string const &key, std::string const &value) {
    setPair(metaData_, key, value);
}

std::string Command::GetMetaDataField(std::string const &key) {
    for (auto const &pair : metaData_) {
        if (pair.first == key) {
            return pair.second;
        }
    }
    return {};
}

std::vector<std::pair<std::string, std::string>> Command::GetMetaData() {
    return metaData_;
}

void Command::AddExample(std::string const &text, std::string const &description) {
    examples_.emplace_back(text, description);
}

void Command::GenerateHelpOutput(boost::shared_ptr<CallSpec::Input> const &input,
                                 boost::shared_ptr<CallSpec::Output> const &output) {
    output->SetResult(MetaObj::MetaString::New(commandHelp(*this, input)));
    output->Complete();
}

std::string Command::GetDefaultOutputFormatter() {
    return defaultFormatter_;
}

} // namespace Plexa::AutoCli
