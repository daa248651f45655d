// SPDX-License-Identifier: Apache-2.0
//
// The command tree: namespaces that hold children, commands that can be called, and the one function through which a
// plug-in hangs its subtree into the tool.
//
// The tool makes the root, loads each plug-in and calls its AutoCli_RegisterNamespaces once. From then on it owns the
// nodes: a parent holds its children strongly, a child knows its parent weakly. The virtual operations stand in the
// slot order that plug-ins are built against; do not reorder them.
#pragma once

#include <cstddef>
#include <string>
#include <utility>
#include <vector>

#include <boost/enable_shared_from_this.hpp>
#include <boost/function.hpp>
#include <boost/shared_ptr.hpp>
#include <boost/weak_ptr.hpp>

#include "plexa/CallSpec.h"

namespace Plexa::AutoCli {

/// Calls a command: what a dispatcher is made of.
using Dispatcher =
    boost::function<void(boost::shared_ptr<CallSpec::Input> const &, boost::shared_ptr<CallSpec::Output> const &)>;

/// A node of the tree. Hold it by boost::shared_ptr before children or parents are attached.
class PLEXA_EXPORT NamespaceNode : public boost::enable_shared_from_this<NamespaceNode> {
public:
    virtual ~NamespaceNode();
    virtual boost::shared_ptr<NamespaceNode> GetThis();
    /// "namespace" or "command".
    virtual std::string GetType();
    /// The name under which the node is registered; empty while it is not.
    virtual std::string GetName();
    virtual void SetName(std::string const &name);
    virtual std::string GetDescription();
    virtual void SetDescription(std::string const &description);
    /// Names from the root's child down to this node.
    virtual std::vector<std::string> GetPath();
    virtual std::string GetPathString(char separator);
    virtual bool HasNamespaceNode(std::string const &name);
    /// In registration order, like GetNamespaceNodes.
    virtual std::vector<std::string> GetNamespaceNodeNames();
    virtual std::vector<boost::shared_ptr<NamespaceNode>> GetNamespaceNodes();
    /// Empty when there is no such child.
    virtual boost::shared_ptr<NamespaceNode> GetNamespaceNode(std::string const &name);
    /// Attaches a child and gives it its name.
    /// @throws std::invalid_argument for an empty node, an empty name or one that is taken; the tree is unchanged.
    virtual void RegisterNamespaceNode(boost::shared_ptr<NamespaceNode> const &node, std::string const &name);
    /// Follows the words down from this node as far as they name children.
    /// @param consumed set to how many words did.
    /// @return the node reached; this node itself when the first word names no child.
    virtual boost::shared_ptr<NamespaceNode> ResolveNode(std::vector<std::string> const &words, std::size_t &consumed);
    /// The child of that name when it is a namespace; made and registered when there is none.
    /// @throws std::invalid_argument when the name belongs to a command.
    virtual boost::shared_ptr<NamespaceNode> SubNamespace(std::string const &name);
    /// What calls this node; empty for a node that cannot be called.
    virtual Dispatcher GetDispatcher();
    virtual void SetParent(boost::shared_ptr<NamespaceNode> const &parent);
    /// Empty for a root and for a node that is not registered.
    virtual boost::shared_ptr<NamespaceNode> GetParent();

protected:
    NamespaceNode() = default;
    NamespaceNode(NamespaceNode const &) = delete;
    NamespaceNode &operator=(NamespaceNode const &) = delete;

private:
    std::string name_;
    std::string description_;
    boost::weak_ptr<NamespaceNode> parent_;
    std::vector<boost::shared_ptr<NamespaceNode>> children_;
};

/// A node that only holds children.
class PLEXA_EXPORT Namespace : public NamespaceNode {
public:
    static boost::shared_ptr<Namespace> New();
    Namespace();
    ~Namespace() override;
};

/// A leaf that can be called. A command class derives virtually from it, sets its description, metadata and formatter
/// settings in its constructor, and overrides the three operations that end in Internal.
///
/// No destructor is declared here: it would take a slot of its own among the operations.
class PLEXA_EXPORT Command : public virtual NamespaceNode, public CallSpec::CallTarget {
public:
    Command();

    boost::shared_ptr<CallSpec::InputSpec> GetInputSpec() override;
    boost::shared_ptr<CallSpec::OutputSpec> GetOutputSpec() override;
    void Execute(boost::shared_ptr<CallSpec::Input> const &input,
                 boost::shared_ptr<CallSpec::Output> const &output) override;

    boost::shared_ptr<NamespaceNode> GetThis() override;
    bool HasNamespaceNode(std::string const &name) override;
    boost::shared_ptr<NamespaceNode> GetNamespaceNode(std::string const &name) override;
    /// @throws std::invalid_argument always: a command has no children.
    void RegisterNamespaceNode(boost::shared_ptr<NamespaceNode> const &node, std::string const &name) override;
    boost::shared_ptr<NamespaceNode> ResolveNode(std::vector<std::string> const &words, std::size_t &consumed) override;
    Dispatcher GetDispatcher() override;
    void SetParent(boost::shared_ptr<NamespaceNode> const &parent) override;
    boost::shared_ptr<NamespaceNode> GetParent() override;
    std::string GetType() override;

    /// Pairs of an example's text and its description, in the order added.
    virtual std::vector<std::pair<std::string, std::string>> GetExamples();
    /// Keys and values in the order in which the keys were first set.
    virtual std::vector<std::pair<std::string, std::string>> GetDefaultOutputFormatParameters();
    virtual void SetDefaultOutputFormatter(std::string const &name);
    /// Setting a key again replaces its value and keeps its place; likewise SetMetaDataField.
    virtual void SetDefaultOutputParameter(std::string const &key, std::string const &value);
    virtual void SetMetaDataField(std::string const &key, std::string const &value);
    /// Empty when unset.
    virtual std::string GetMetaDataField(std::string const &key);
    virtual std::vector<std::pair<std::string, std::string>> GetMetaData();
    virtual boost::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() = 0;
    virtual boost::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() = 0;
    virtual void ExecuteInternal(boost::shared_ptr<CallSpec::Input> const &input,
                                 boost::shared_ptr<CallSpec::Output> const &output) = 0;
    virtual void AddExample(std::string const &text, std::string const &description);
    /// Leaves the command's help as a text in the output's result and completes it.
    virtual void GenerateHelpOutput(boost::shared_ptr<CallSpec::Input> const &input,
                                    boost::shared_ptr<CallSpec::Output> const &output);

    /// The formatter that the command asks for; empty when it names none.
    std::string GetDefaultOutputFormatter();

private:
    using Pairs = std::vector<std::pair<std::string, std::string>>;

    std::string defaultFormatter_;
    Pairs formatParameters_;
    Pairs metaData_;
    Pairs examples_;
};

} // namespace Plexa::AutoCli

/// A plug-in's entry point: hangs the plug-in's subtree below the root. Reports failure only by throwing; what was
/// registered before the failure stays.
extern "C" PLEXA_EXPORT void AutoCli_RegisterNamespaces(boost::shared_ptr<Plexa::AutoCli::Namespace> &root);
