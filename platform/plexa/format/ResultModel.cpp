// SPDX-License-Identifier: Apache-2.0
#include "ResultModel.h"

#include <algorithm>

namespace Plexa {

using namespace MetaObj;

namespace {

template <typename Value>
Value const *as(Object const &object) {
    return dynamic_cast<Value const *>(object.get());
}

Kind kindOfOne(Object const &object) {
    if (object == nullptr) {
        return Kind::Nothing;
    }
    if (auto const *list = as<MetaList>(object)) {
        return list->GetType() == StructList ? Kind::StructList : Kind::ScalarList;
    }
    if (as<MetaStruct>(object) != nullptr) {
        return Kind::Struct;
    }
    return as<MetaInt>(object) != nullptr ? Kind::Number : Kind::Scalar;
}

} // namespace

Kind kindOf(Object const &value, Object const &schema) {
    return kindOfOne(value != nullptr ? value : schema);
}

bool isSet(Object const &value) {
    return value != nullptr && value->IsSet();
}

std::string scalarText(Object const &value) {
    if (!isSet(value)) {
        return {};
    }
    if (auto const *text = as<MetaString>(value)) {
        return text->GetValue();
    }
    if (auto const *number = as<MetaInt>(value)) {
        return std::to_string(number->GetValue());
    }
    if (auto const *truth = as<MetaBool>(value)) {
        return truth->GetValue() ? "true" : "false";
    }
    return {};
}

Object elementSchema(Object const &list, Object const &schema) {
    auto const *made = as<MetaList>(list);
    auto const *declared = as<MetaList>(schema);
    Object element = declared != nullptr ? declared->GetElementSchema() : Object();
    return element == nullptr && made != nullptr ? made->GetElementSchema() : element;
}

std::vector<FieldView> fieldsOf(Object const &value, Object const &schema) {
    auto const *made = as<MetaStruct>(value);
    auto const *declared = as<MetaStruct>(schema);
    std::vector<FieldView> fields;
    if (declared != nullptr) {
        for (std::string const &name : declared->GetFieldNames()) {
            fields.push_back({name, made != nullptr ? made->GetField(name) : Object(), declared->GetField(name)});
        }
    }
    if (made != nullptr) {
        for (std::string const &name : made->GetFieldNames()) {
            if (declared == nullptr || declared->GetField(name) == nullptr) {
                fields.push_back({name, made->GetField(name), Object()});
            }
        }
    }
    return fields;
}

std::vector<FieldView> selected(std::vector<FieldView> const &fields, std::vector<std::string> const &names) {
    std::vector<FieldView> chosen;
    for (std::string const &name : names) {
        auto const found =
            std::find_if(fields.begin(), fields.end(), [&name](FieldView const &field) { return field.name == name; });
        if (found != fields.end()) {
            chosen.push_back(*found);
        }
    }
    return chosen;
}

std::string structureName(Object const &value, Object const &schema) {
    auto const *made = as<MetaStruct>(value);
    auto const *structure = made != nullptr ? made : as<MetaStruct>(schema);
    return structure != nullptr ? structure->GetName() : std::string();
}

} // namespace Plexa
