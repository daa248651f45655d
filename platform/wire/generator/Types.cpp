// SPDX-License-Identifier: Apache-2.0
#include "Types.h"

#include <stdexcept>

#include "Names.h"

namespace CompactGenerator {

namespace {

using capnp::schema::Type;
using capnp::schema::Value;

std::string nameOf(capnp::Type type) {
    return scopedName(type.asStruct().getProto().getDisplayName().cStr());
}

/// @return empty for what is no whole number
std::string numberName(Type::Which which) {
    switch (which) {
    case Type::INT8:
        return "std::int8_t";
    case Type::INT16:
        return "std::int16_t";
    case Type::INT32:
        return "std::int32_t";
    case Type::INT64:
        return "std::int64_t";
    case Type::UINT8:
        return "std::uint8_t";
    case Type::UINT16:
        return "std::uint16_t";
    case Type::UINT32:
        return "std::uint32_t";
    case Type::UINT64:
        return "std::uint64_t";
    default:
        return "";
    }
}

std::string elementName(capnp::Type type) {
    FieldType const element = fieldType(type);
    switch (element.kind) {
    case FieldType::Number:
    case FieldType::Struct:
        return element.name;
    case FieldType::Text:
        return "Text";
    default:
        throw std::runtime_error("lists of such elements are not supported");
    }
}

template <typename Integer>
std::string literal(Integer value, char const *suffix) {
    return value == 0 ? "" : std::to_string(value) + suffix;
}

} // namespace

FieldType fieldType(capnp::Type type) {
    switch (type.which()) {
    case Type::VOID:
        return {FieldType::Void, ""};
    case Type::BOOL:
        return {FieldType::Bool, "bool"};
    case Type::TEXT:
        return {FieldType::Text, ""};
    case Type::DATA:
        return {FieldType::Data, ""};
    case Type::STRUCT:
        return {FieldType::Struct, nameOf(type)};
    case Type::LIST:
        return {FieldType::List, elementName(type.asList().getElementType())};
    default:
        break;
    }
    std::string const number = numberName(type.which());
    if (number.empty()) {
        throw std::runtime_error("fields of such a type are not supported");
    }
    return {FieldType::Number, number};
}

std::string defaultOf(Value::Reader value) {
    switch (value.which()) {
    case Value::VOID:
        return "";
    case Value::BOOL:
        return value.getBool() ? "true" : "";
    case Value::INT8:
        return literal(value.getInt8(), "");
    case Value::INT16:
        return literal(value.getInt16(), "");
    case Value::INT32:
        return literal(value.getInt32(), "");
    case Value::INT64:
        return literal(value.getInt64(), "");
    case Value::UINT8:
        return literal(value.getUint8(), "");
    case Value::UINT16:
        return literal(value.getUint16(), "");
    case Value::UINT32:
        return literal(value.getUint32(), "U");
    case Value::UINT64:
        return literal(value.getUint64(), "U");
    default:
        throw std::runtime_error("defaults of such a type are not supported");
    }
}

} // namespace CompactGenerator
