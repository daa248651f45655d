// SPDX-License-Identifier: Apache-2.0
//
// What every command of `cli` stands on: the framework's types under short names, and declarations written as data.
#pragma once

#include <initializer_list>
#include <string>
#include <vector>

#include <boost/shared_ptr.hpp>

#include "CliServices.h"
#include "plexa/AutoCli.h"

namespace Tovicli::Cli {

using InputPtr = boost::shared_ptr<Plexa::CallSpec::Input>;
using OutputPtr = boost::shared_ptr<Plexa::CallSpec::Output>;
using InputSpecPtr = boost::shared_ptr<Plexa::CallSpec::InputSpec>;
using OutputSpecPtr = boost::shared_ptr<Plexa::CallSpec::OutputSpec>;
using ObjectPtr = boost::shared_ptr<Plexa::MetaObj::MetaObject>;
using StructPtr = boost::shared_ptr<Plexa::MetaObj::MetaStruct>;
using ListPtr = boost::shared_ptr<Plexa::MetaObj::MetaList>;
using NodePtr = boost::shared_ptr<Plexa::AutoCli::NamespaceNode>;
using CommandPtr = boost::shared_ptr<Plexa::AutoCli::Command>;

/// One parameter as a command declares it.
struct Parameter {
    char const *name;
    Plexa::CallSpec::ParameterType type;
    bool required;
    char const *description;
};

/// @return an InputSpec of the parameters, in the order given.
InputSpecPtr declareParameters(std::initializer_list<Parameter> parameters);

/// @return an OutputSpec for a result that looks like the schema.
OutputSpecPtr declareResult(ObjectPtr const &schema);

/// @return an empty list of structures that look like the schema.
ListPtr makeStructList(StructPtr const &elementSchema);

/// A structure whose fields are all texts, none set.
StructPtr textStructure(char const *name, std::initializer_list<char const *> fields);

/// Base of the commands of `cli`: they are operations on the tool, which lends them its services.
class CliCommand : public virtual Plexa::AutoCli::Command {
protected:
    explicit CliCommand(CliServices &services);

    CliServices &services_;
};

} // namespace Tovicli::Cli
