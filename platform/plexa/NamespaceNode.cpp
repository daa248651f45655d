// SPDX-License-Identifier: Apache-2.0
#include "plexa/AutoCli.h"

#include <algorithm>
#include <stdexcept>

#include <boost/make_shared.hpp>

namespace Plexa::AutoCli {

NamespaceNode::~NamespaceNode() = default;

boost::shared_ptr<NamespaceNode> NamespaceNode::GetThis() {
    return shared_from_this();
}

std::string NamespaceNode::GetType() {
    return "namespace";
}

std::string NamespaceNode::GetName() {
    return name_;
}

void NamespaceNode::SetName(std::string const &name) {
    name_ = name;
}

std::string NamespaceNode::GetDescription() {
    return description_;
}

void NamespaceNode::SetDescription(std::string const &description) {
    description_ = description;
}

std::vector<std::string> NamespaceNode::GetPath() {
    std::vector<std::string> path;
    boost::shared_ptr<NamespaceNode> parent = GetParent();
    if (parent == nullptr) {
        return path; // a root: what users type begins below it
    }
    path.push_back(GetName());
    while (boost::shared_ptr<NamespaceNode> next = parent->GetParent()) {
        path.push_back(parent->GetName());
        parent = next;
    }
    std::reverse(path.begin(), path.end());
    return path;
}

std::string NamespaceNode::GetPathString(char separator) {
    std::string joined;
    for (std::string const &name : GetPath()) {
        if (!joined.empty()) {
            joined += separator;
        }
        joined += name;
    }
    return joined;
}

bool NamespaceNode::HasNamespaceNode(std::string const &name) {
    return GetNamespaceNode(name) != nullptr;
}

std::vector<std::string> NamespaceNode::GetNamespaceNodeNames() {
    std::vector<std::string> names;
    names.reserve(children_.size());
    for (auto const &child : children_) {
        names.push_back(child->GetName());
    }
    return names;
}

std::vector<boost::shared_ptr<NamespaceNode>> NamespaceNode::GetNamespaceNodes() {
    return children_;
}

boost::shared_ptr<NamespaceNode> NamespaceNode::GetNamespaceNode(std::string const &name) {
    for (auto const &child : children_) {
        if (child->GetName() == name) {
            return child;
        }
    }
    return {};
}

void NamespaceNode::RegisterNamespaceNode(boost::shared_ptr<NamespaceNode> const &node, std::string const &name) {
    if (node == nullptr) {
        throw std::invalid_argument("cannot register an empty node under the name '" + name + "'");
    }
    if (name.empty()) {
        throw std::invalid_argument("cannot register a node under an empty name");
    }
    if (HasNamespaceNode(name)) {
        throw std::invalid_argument("the name '" + name + "' is already taken in '" + GetPathString(' ') + "'");
    }
    if (boost::shared_ptr<NamespaceNode> parent = node->GetParent()) {
        // The node carries its name and knows one parent: a second place would change both behind the first one's back.
        throw std::invalid_argument("cannot register a node under the name '" + name +
                                    "': it is already registered as '" + node->GetPathString(' ') + "'");
    }
    boost::shared_ptr<NamespaceNode> const self = GetThis();
    for (boost::shared_ptr<NamespaceNode> above = self; above != nullptr; above = above->GetParent()) {
        if (above == node) {
            throw std::invalid_argument("cannot register a node below itself under the name '" + name + "'");
        }
    }
    children_.reserve(children_.size() + 1);
    node->SetName(name);
    node->SetParent(self);
    children_.push_back(node);
}

boost::shared_ptr<NamespaceNode> NamespaceNode::ResolveNode(std::vector<std::string> const &words,
                                                            std::size_t &consumed) {
    boost::shared_ptr<NamespaceNode> node = GetThis();
    consumed = 0;
    while (consumed < words.size()) {
        boost::shared_ptr<NamespaceNode> const child = node->GetNamespaceNode(words[consumed]);
        if (child == nullptr) {
            break;
        }
        node = child;
        ++consumed;
    }
    return node;
}

boost::shared_ptr<NamespaceNode> NamespaceNode::SubNamespace(std::string const &name) {
    boost::shared_ptr<NamespaceNode> child = GetNamespaceNode(name);
    if (child == nullptr) {
        child = Namespace::New();
        RegisterNamespaceNode(child, name);
        return child;
    }
    if (boost::dynamic_pointer_cast<Namespace>(child) == nullptr) {
        throw std::invalid_argument("'" + child->GetPathString(' ') + "' is a command, not a namespace");
    }
    return child;
}

Dispatcher NamespaceNode::GetDispatcher() {
    return {};
}

void NamespaceNode::SetParent(boost::shared_ptr<NamespaceNode> const &parent) {
    parent_ = parent;
}

boost::shared_ptr<NamespaceNode> NamespaceNode::GetParent() {
    return parent_.lock();
}

boost::shared_ptr<Namespace> Namespace::New() {
    return boost::make_shared<Namespace>();
}

Namespace::Namespace() = default;
Namespace::~Namespace() = default;

} // namespace Plexa::AutoCli
