// SPDX-License-Identifier: Apache-2.0
//
// The walk that all formats for programs share: which values there are, in which order, under which names. What a
// format adds is its writer, which is told of one piece after the other:
//
//   unset() boolean(bool) number(int64_t) text(std::string_view)
//   beginList(count)   element(index) and a value, for each   endList(count)
//   beginStruct(structure, count)   field(plan, index) and a value, for each   endStruct(count)
//   static std::string label(name)      a field's name as the format writes it; made once for a list
#pragma once

#include <string>
#include <utility>

#include "ResultModel.h"

namespace Plexa {

template <typename Writer>
class MachineWalk {
public:
    MachineWalk(std::string format, FormatSettings const &settings, Writer &writer)
        : format_(std::move(format))
        , outermost_(
              settings, [&settings](std::string const &) { return settings.chosenFields(); }, Writer::label)
        , nested_(
              settings, [](std::string const &) { return std::nullopt; }, Writer::label)
        , writer_(writer) {}

    /// A list may be long, and a walk of its own to check it would cost half as much as the writing: it is checked on
    /// the way. What comes before a value that is refused has been written then.
    /// @throws FormatError, see checkShape
    void result(Result const &result) {
        if (typeOf(result.value.get()) != ValueType::List) {
            checkShape(result.value.get(), format_);
        }
        value(result.value.get(), result.schema.get(), true);
    }

    /// A value that stands inside a result that was checked: the user's choice of fields does not reach it.
    void nested(MetaObj::MetaObject const *value, MetaObj::MetaObject const *schema) {
        this->value(value, schema, false);
    }

private:
    void value(MetaObj::MetaObject const *value, MetaObj::MetaObject const *schema, bool outermost) {
        switch (typeOf(value)) {
        case ValueType::Boolean:
            writer_.boolean(as<MetaObj::MetaBool>(value).GetValue());
            break;
        case ValueType::Number:
            writer_.number(as<MetaObj::MetaInt>(value).GetValue());
            break;
        case ValueType::Text:
            writer_.text(as<MetaObj::MetaString>(value).ViewValue());
            break;
        case ValueType::List:
            list(as<MetaObj::MetaList>(value), schema, outermost);
            break;
        case ValueType::Struct:
            structure(as<MetaObj::MetaStruct>(value), schema, outermost);
            break;
        case ValueType::Unset:
            writer_.unset();
            break;
        case ValueType::Unknown:
            refuse(format_, fieldName(), isOfUnknownKind);
        }
    }

    void list(MetaObj::MetaList const &list, MetaObj::MetaObject const *schema, bool outermost) {
        Object const element = elementSchema(&list, schema);
        std::vector<Object> const &elements = list.ViewElements();
        enter();
        writer_.beginList(elements.size());
        for (std::size_t i = 0; i < elements.size(); ++i) {
            writer_.element(i);
            value(elements[i].get(), element.get(), outermost);
        }
        --depth_;
        writer_.endList(elements.size());
    }

    void structure(MetaObj::MetaStruct const &structure, MetaObj::MetaObject const *schema, bool outermost) {
        // Held, since a structure inside may have another plan made for the same schema.
        std::shared_ptr<StructurePlan const> const plan = (outermost ? outermost_ : nested_).planOf(structure, schema);
        FieldPlan const *const around = field_;
        enter();
        writer_.beginStruct(structure, plan->size());
        MetaObj::MetaStruct::Fields const fields = structure.ViewFields();
        for (std::size_t i = 0; i < plan->size(); ++i) {
            FieldPlan const &field = (*plan)[i];
            writer_.field(field, i);
            field_ = &field;
            value(valueOf(fields, field), field.schema, false);
        }
        field_ = around;
        --depth_;
        writer_.endStruct(plan->size());
    }

    void enter() {
        if (++depth_ > deepestNesting) {
            refuse(format_, fieldName(), isNestedTooDeep);
        }
    }

    std::string const *fieldName() const {
        return field_ != nullptr ? &field_->name : nullptr;
    }

    std::string format_;
    std::size_t depth_ = 0;
    FieldPlan const *field_ = nullptr; // the one that the walk is in
    StructurePlans outermost_;         // of these alone the user chooses fields
    StructurePlans nested_;
    Writer &writer_;
};

} // namespace Plexa
