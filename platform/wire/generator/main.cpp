// SPDX-License-Identifier: Apache-2.0
//
// A back end of `capnp compile`: turns the schema that it reads from its standard input into the readers and builders
// of wire/compact, NAME.capnp into NAME.compact.h. A tool of the build; nothing of it is installed.
//
//   capnp compile -o<this program>:DIRECTORY --src-prefix=FOLDER FOLDER/NAME.capnp
#include <cstdio>
#include <exception>
#include <fstream>
#include <stdexcept>
#include <string>

#include <capnp/schema-loader.h>
#include <capnp/schema.capnp.h>
#include <capnp/serialize.h>

#include "Names.h"
#include "StructCode.h"
#include "Types.h"

namespace {

using namespace CompactGenerator;

/// Of the annotation that names a file's C++ namespace, in the library's c++.capnp.
constexpr std::uint64_t namespaceAnnotation = 0xb9c6f99ebf805f2c;

std::string namespaceOf(capnp::schema::Node::Reader file) {
    for (auto const annotation : file.getAnnotations()) {
        if (annotation.getId() == namespaceAnnotation) {
            return annotation.getValue().getText().cStr();
        }
    }
    throw std::runtime_error("the file names no C++ namespace");
}

std::string constantCode(capnp::ConstSchema schema, std::string const &name) {
    FieldType const type = fieldType(schema.getType());
    if (type.kind != FieldType::Number && type.kind != FieldType::Bool) {
        throw std::runtime_error(name + ": constants of such a type are not supported");
    }
    std::string const value = defaultOf(schema.getProto().getConst().getValue());
    return "inline constexpr " + type.name + " " + enumerator(name) + "{" + value + "};\n";
}

std::string headerOf(capnp::Schema file, capnp::SchemaLoader const &loader) {
    std::string constants;
    StructCode structs;
    for (auto const node : file.getProto().getNestedNodes()) {
        capnp::Schema const schema = loader.get(node.getId());
        if (schema.getProto().isStruct()) {
            StructCode const code = structCode(schema.asStruct(), loader, "");
            structs.shell += code.shell;
            structs.classes += code.classes;
            structs.functions += code.functions;
        } else if (schema.getProto().isConst()) {
            constants += constantCode(schema.asConst(), node.getName().cStr());
        } else if (!schema.getProto().isAnnotation()) {
            throw std::runtime_error(std::string(node.getName().cStr()) + ": such a declaration is not supported");
        }
    }
    std::string const scope = namespaceOf(file.getProto()) + "::Compact";
    return "// Generated from the schema; change that.\n#pragma once\n\n"
           "#include <cassert>\n#include <cstddef>\n#include <cstdint>\n#include <span>\n#include <string_view>\n\n"
           "#include \"wire/compact/List.h\"\n\nnamespace " +
           scope + " {\n\n" + constants + "\n" + structs.shell + "\n" + structs.classes + structs.functions +
           "\n} // namespace " + scope + "\n";
}

void writeFile(std::string const &path, std::string const &content) {
    std::ofstream file(path, std::ios::binary);
    if (!(file << content) || !file.flush()) {
        throw std::runtime_error(path + " cannot be written");
    }
}

void generate() {
    capnp::StreamFdMessageReader message(0);
    auto const request = message.getRoot<capnp::schema::CodeGeneratorRequest>();
    capnp::SchemaLoader loader;
    for (auto const node : request.getNodes()) {
        loader.load(node);
    }
    for (auto const file : request.getRequestedFiles()) {
        std::string const name = file.getFilename().cStr();
        writeFile(name.substr(0, name.rfind('.')) + ".compact.h", headerOf(loader.get(file.getId()), loader));
    }
}

} // namespace

int main() {
    try {
        generate();
    } catch (kj::Exception const &exception) {
        std::fprintf(stderr, "the schema cannot be read: %s\n", exception.getDescription().cStr());
        return 1;
    } catch (std::exception const &exception) {
        std::fprintf(stderr, "%s\n", exception.what());
        return 1;
    }
    return 0;
}
