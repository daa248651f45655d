// SPDX-License-Identifier: Apache-2.0
#include "ResultModel.h"

#include <algorithm>
#include <utility>

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

StructurePlan selected(StructurePlan const &fields, std::vector<std::string> const &names) {
    StructurePlan chosen;
    for (std::string const &name : names) {
        auto const found =
            std::find_if(fields.begin(), fields.end(), [&name](FieldPlan const &field) { return field.name == name; });
        if (found != fields.end()) {
            chosen.push_back(*found);
        }
    }
    return chosen;
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

StructurePlans::StructurePlans(FormatSettings const &settings, Choice choice)
    : settings_(settings)
    , choice_(std::move(choice)) {}

std::shared_ptr<StructurePlan const> StructurePlans::planOf(MetaStruct const &structure, Object const &schema) {
    std::vector<std::string> names = structure.GetFieldNames();
    Known &known = known_[schema.get()];
    if (known.plan != nullptr && known.names == names) {
        return known.plan;
    }
    StructurePlan fields;
    auto const *declared = as<MetaStruct>(schema);
    std::string const name = declared != nullptr ? declared->GetName() : structure.GetName();
    if (declared != nullptr) {
        for (std::string const &field : declared->GetFieldNames()) {
            fields.push_back({field, declared->GetField(field), settings_.unit(name, field)});
        }
    }
    for (std::string const &field : names) {
        if (declared == nullptr || declared->GetField(field) == nullptr) {
            fields.push_back({field, Object(), settings_.unit(name, field)});
        }
    }
    if (std::optional<std::vector<std::string>> const chosen = choice_(name)) {
        fields = selected(fields, *chosen);
    }
    known.names = std::move(names);
    known.plan = std::make_shared<StructurePlan const>(std::move(fields));
    return known.plan;
}

} // namespace Plexa
