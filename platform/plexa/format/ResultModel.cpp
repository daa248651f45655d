// SPDX-License-Identifier: Apache-2.0
#include "ResultModel.h"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <utility>

#include "plexa/Text.h"

namespace Plexa {

using namespace MetaObj;

namespace {

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

/// Names are short, and compared so often that a call for each would show.
bool isSame(std::string const &left, std::string const &right) {
    if (left.size() != right.size()) {
        return false;
    }
    std::size_t at = 0;
    for (; at + sizeof(uint64_t) <= left.size(); at += sizeof(uint64_t)) {
        uint64_t first = 0;
        uint64_t second = 0;
        std::memcpy(&first, left.data() + at, sizeof(first));
        std::memcpy(&second, right.data() + at, sizeof(second));
        if (first != second) {
            return false;
        }
    }
    for (; at < left.size(); ++at) {
        if (left[at] != right[at]) {
            return false;
        }
    }
    return true;
}

bool haveNames(MetaStruct::Fields const &fields, std::vector<std::string> const &names) {
    bool same = fields.size() == names.size();
    for (std::size_t i = 0; same && i < names.size(); ++i) {
        same = isSame(fields.name(i), names[i]);
    }
    return same;
}

/// Walks through a result and remembers the field it is in.
class ShapeCheck {
public:
    ShapeCheck(std::string const &format, std::string const *field)
        : format_(format)
        , field_(field) {}

    void check(MetaObject const *value, std::size_t depth) {
        if (depth > deepestNesting) {
            refuse(format_, field_, isNestedTooDeep);
        }
        switch (declaredType(value)) {
        case ValueType::List:
            for (Object const &element : as<MetaList>(value).ViewElements()) {
                check(element.get(), depth + 1);
            }
            break;
        case ValueType::Struct:
            structure(as<MetaStruct>(value).ViewFields(), depth);
            break;
        case ValueType::Unknown:
            refuse(format_, field_, isOfUnknownKind);
        default:
            break;
        }
    }

private:
    void structure(MetaStruct::Fields const &fields, std::size_t depth) {
        for (std::size_t i = 0; i < fields.size(); ++i) {
            std::string const *const around = std::exchange(field_, &fields.name(i));
            check(fields.value(i), depth + 1);
            field_ = around;
        }
    }

    std::string const &format_;
    std::string const *field_;
};

} // namespace

ValueType typeOfDerived(MetaObject const *value) {
    return dynamic_cast<MetaString const *>(value) != nullptr   ? ValueType::Text
           : dynamic_cast<MetaInt const *>(value) != nullptr    ? ValueType::Number
           : dynamic_cast<MetaBool const *>(value) != nullptr   ? ValueType::Boolean
           : dynamic_cast<MetaList const *>(value) != nullptr   ? ValueType::List
           : dynamic_cast<MetaStruct const *>(value) != nullptr ? ValueType::Struct
                                                                : ValueType::Unknown;
}

Kind kindOf(MetaObject const *value, MetaObject const *schema) {
    MetaObject const *const one = value != nullptr ? value : schema;
    switch (declaredType(one)) {
    case ValueType::Unset:
        return Kind::Nothing;
    case ValueType::List:
        return as<MetaList>(one).GetType() == StructList ? Kind::StructList : Kind::ScalarList;
    case ValueType::Struct:
        return Kind::Struct;
    case ValueType::Number:
        return Kind::Number;
    default:
        return Kind::Scalar;
    }
}

bool isSet(Object const &value) {
    return value != nullptr && value->IsSet();
}

std::string scalarText(MetaObject const *value) {
    switch (typeOf(value)) {
    case ValueType::Text:
        return as<MetaString>(value).GetValue();
    case ValueType::Number:
        return std::to_string(as<MetaInt>(value).GetValue());
    case ValueType::Boolean:
        return as<MetaBool>(value).GetValue() ? "true" : "false";
    default:
        return {};
    }
}

Object elementSchema(MetaList const *list, MetaObject const *schema) {
    Object element = declaredType(schema) == ValueType::List ? as<MetaList>(schema).GetElementSchema() : Object();
    return element == nullptr && list != nullptr ? list->GetElementSchema() : element;
}

void refuse(std::string const &format, std::string const *field, char const *why) {
    throw FormatError("the format " + format + " cannot hold the result: " +
                      (field != nullptr ? "the field '" + escaped(*field) + "' " : "its value ") + why);
}

void checkShape(MetaObject const *value, std::string const &format, std::string const *field) {
    ShapeCheck(format, field).check(value, 0);
}

MetaObject const *findValue(MetaStruct::Fields const &fields, std::string const &name) {
    for (std::size_t i = 0; i < fields.size(); ++i) {
        if (fields.name(i) == name) {
            return fields.value(i);
        }
    }
    return nullptr;
}

MetaObject const *findValue(MetaStruct const &structure, FieldPlan const &field) {
    MetaStruct::Fields const fields = structure.ViewFields();
    if (field.index < fields.size() && isSame(fields.name(field.index), field.name)) {
        return fields.value(field.index);
    }
    return findValue(fields, field.name);
}

void merge(StructurePlan &plan, StructurePlan const &more) {
    for (FieldPlan const &field : more) {
        bool const isKnown = std::any_of(plan.begin(), plan.end(),
                                         [&field](FieldPlan const &known) { return known.name == field.name; });
        if (!isKnown) {
            plan.push_back(field);
        }
    }
}

StructurePlans::StructurePlans(FormatSettings const &settings, Choice choice, Label label)
    : settings_(settings)
    , choice_(std::move(choice))
    , label_(label) {}

std::shared_ptr<StructurePlan const> StructurePlans::planOf(MetaStruct const &structure, MetaObject const *schema) {
    if (last_ == nullptr || lastSchema_ != schema) {
        last_ = &known_[schema];
        lastSchema_ = schema;
    }
    Known &known = *last_;
    MetaStruct::Fields const fields = structure.ViewFields();
    if (known.plan != nullptr && schema != nullptr && fields.sharesNames(known.shared)) {
        return known.plan;
    }
    bool const isKnown = known.plan != nullptr && haveNames(fields, known.names) &&
                         (schema != nullptr || known.structure == structure.GetName());
    known.shared = fields.names();
    if (!isKnown) {
        known.structure = structure.GetName();
        known.names = structure.GetFieldNames();
        known.plan = std::make_shared<StructurePlan const>(made(structure, schema));
    }
    return known.plan;
}

StructurePlan StructurePlans::made(MetaStruct const &structure, MetaObject const *schema) const {
    bool const isDeclared = declaredType(schema) == ValueType::Struct;
    std::string const name = isDeclared ? as<MetaStruct>(schema).GetName() : structure.GetName();
    StructurePlan plan;
    std::map<std::string, std::size_t> places; // of the plan's fields
    if (isDeclared) {
        MetaStruct::Fields const declared = as<MetaStruct>(schema).ViewFields();
        for (std::size_t i = 0; i < declared.size(); ++i) {
            std::string const &field = declared.name(i);
            places.emplace(field, plan.size());
            plan.push_back({field, declared.value(i), settings_.unit(name, field), label_(field)});
        }
    }
    MetaStruct::Fields const fields = structure.ViewFields();
    for (std::size_t i = 0; i < fields.size(); ++i) {
        std::string const &field = fields.name(i);
        auto const [place, isNew] = places.emplace(field, plan.size());
        if (isNew) {
            plan.push_back({field, nullptr, settings_.unit(name, field), label_(field)});
        }
        plan[place->second].index = i;
    }
    std::optional<std::vector<std::string>> const chosen = choice_(name);
    return chosen ? selected(plan, *chosen) : plan;
}

} // namespace Plexa
