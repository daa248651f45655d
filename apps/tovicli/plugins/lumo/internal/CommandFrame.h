// SPDX-License-Identifier: Apache-2.0
//
// What every command unit stands on: the framework's types under short names, and declarations written as data.
//
// A command unit reads the same everywhere: constructor, destructor where it holds a session, parameters, schema,
// execute.
#pragma once

#include <cstdint>
#include <initializer_list>

#include <boost/shared_ptr.hpp>

#include "plexa/AutoCli.h"
#include "plexa/CallSpec.h"
#include "plexa/MetaObj.h"

// The command classes are all that the plug-in shows besides its entry point.
#define LUMO_COMMAND_EXPORT __attribute__((visibility("default")))

namespace TarselCli::LumoNamespace {

using InputPtr = boost::shared_ptr<Plexa::CallSpec::Input>;
using OutputPtr = boost::shared_ptr<Plexa::CallSpec::Output>;
using InputSpecPtr = boost::shared_ptr<Plexa::CallSpec::InputSpec>;
using OutputSpecPtr = boost::shared_ptr<Plexa::CallSpec::OutputSpec>;
using StructPtr = boost::shared_ptr<Plexa::MetaObj::MetaStruct>;
using ListPtr = boost::shared_ptr<Plexa::MetaObj::MetaList>;

/// One parameter as a command declares it.
struct Parameter {
    char const *name;
    Plexa::CallSpec::ParameterType type;
    /// One letter; null for a parameter that has only its long name.
    char const *alias;
    bool required;
    char const *description;
};

/// @return an InputSpec of the parameters, in the order given.
InputSpecPtr declareParameters(std::initializer_list<Parameter> parameters);

/// @return an OutputSpec for a result that looks like the schema.
OutputSpecPtr declareResult(boost::shared_ptr<Plexa::MetaObj::MetaObject> const &schema);

/// @return an empty list of structures that look like the schema.
ListPtr makeStructList(StructPtr const &elementSchema);

/// The low 32 bits of a number given by the user; what the services take is 32 bits wide.
inline int32_t lowWord(int64_t value) {
    return static_cast<int32_t>(static_cast<uint32_t>(value));
}

} // namespace TarselCli::LumoNamespace
