// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include <capnp/schema.capnp.h>
#include <capnp/schema.h>

namespace CompactGenerator {

/// What a field's accessors are made from.
struct FieldType {
    enum Kind { Void, Bool, Number, Text, Data, Struct, List };

    Kind kind = Void;
    /// Number: its C++ type. Struct: the scoped name. List: the element as List<> takes it.
    std::string name;
};

/// @throw std::runtime_error for types that lumod.capnp does not use, so that nobody believes they were supported
FieldType fieldType(capnp::Type type);

/// @return the default as a literal, empty when it is zero
/// @throw std::runtime_error for a default that is a text, a structure or a list
std::string defaultOf(capnp::schema::Value::Reader value);

} // namespace CompactGenerator
