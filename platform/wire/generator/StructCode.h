// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include <capnp/schema-loader.h>
#include <capnp/schema.h>

namespace CompactGenerator {

/// The code of one structure in three parts, each of which needs the parts before it of all structures: what there is,
/// the classes, and their functions.
struct StructCode {
    std::string shell;
    std::string classes;
    std::string functions;
};

/// @param indent stands before each line of the shell, which nests as the schema does
/// @throw std::runtime_error that names the field which is not supported
StructCode structCode(capnp::StructSchema schema, capnp::SchemaLoader const &loader, std::string const &indent);

} // namespace CompactGenerator
