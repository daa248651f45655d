// SPDX-License-Identifier: Apache-2.0
#include "RequestCheck.h"

#include <optional>
#include <vector>

#include <capnp/dynamic.h>

namespace Lumod {

namespace {

using Field = capnp::StructSchema::Field;

/// Which fields of a request can be malformed: those that point somewhere. Found once, since most requests have one,
/// and to ask the schema takes longer than to answer them.
struct PointerFields {
    explicit PointerFields(capnp::StructSchema schema)
        : members(schema.getUnionFields().size()) {
        for (Field const field : schema.getNonUnionFields()) {
            if (isPointer(field)) {
                always.push_back(field);
            }
        }
        for (Field const field : schema.getUnionFields()) {
            if (isPointer(field)) {
                members.at(field.getProto().getDiscriminantValue()) = field;
            }
        }
    }

    static bool isPointer(Field const &field) {
        capnp::Type const type = field.getType();
        return type.isText() || type.isData() || type.isList() || type.isStruct() || type.isInterface() ||
               type.isAnyPointer();
    }

    std::vector<Field> always;
    std::vector<std::optional<Field>> members; ///< of the union, by discriminant
};

void readStruct(capnp::DynamicStruct::Reader const &structure);

void readValue(capnp::DynamicValue::Reader const &value) {
    switch (value.getType()) {
    case capnp::DynamicValue::STRUCT:
        readStruct(value.as<capnp::DynamicStruct>());
        break;
    case capnp::DynamicValue::LIST:
        for (capnp::DynamicValue::Reader const element : value.as<capnp::DynamicList>()) {
            readValue(element);
        }
        break;
    default:
        break; // read when it was got
    }
}

void readStruct(capnp::DynamicStruct::Reader const &structure) {
    for (Field const field : structure.getSchema().getNonUnionFields()) {
        readValue(structure.get(field));
    }
    KJ_IF_MAYBE (field, structure.which()) {
        readValue(structure.get(*field));
    }
}

} // namespace

void readWhole(Wire::Request::Reader request) {
    static PointerFields const fields(capnp::Schema::from<Wire::Request>());
    capnp::DynamicStruct::Reader const structure = request;
    for (Field const &field : fields.always) {
        readValue(structure.get(field));
    }
    auto const which = static_cast<std::size_t>(request.which());
    // A member that this version does not know is not dispatched.
    if (which < fields.members.size() && fields.members[which]) {
        readValue(structure.get(*fields.members[which]));
    }
}

} // namespace Lumod
