// SPDX-License-Identifier: Apache-2.0
#include "RequestCheck.h"

namespace Lumod {

namespace {

void readValue(capnp::DynamicValue::Reader const &value) {
    switch (value.getType()) {
    case capnp::DynamicValue::STRUCT:
        readWhole(value.as<capnp::DynamicStruct>());
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

} // namespace

void readWhole(capnp::DynamicStruct::Reader const &structure) {
    for (capnp::StructSchema::Field const field : structure.getSchema().getNonUnionFields()) {
        readValue(structure.get(field));
    }
    KJ_IF_MAYBE (field, structure.which()) {
        readValue(structure.get(*field));
    }
}

} // namespace Lumod
