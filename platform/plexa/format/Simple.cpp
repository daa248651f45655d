// SPDX-License-Identifier: Apache-2.0
#include "Formats.h"
#include "Paint.h"
#include "ResultModel.h"
#include "TextBuffer.h"
#include "plexa/Text.h"

namespace Plexa {

using namespace MetaObj;

namespace {

constexpr std::size_t step = 2;

class SimpleWriter {
public:
    SimpleWriter(FormatSettings const &settings, Sink &sink)
        : settings_(settings)
        , paint_(settings.display())
        , plans_(
              settings, [&settings](std::string const &structure) { return settings.fields(structure); },
              [](std::string const &name) { return escaped(name); })
        , out_(sink) {}

    void value(MetaObject const *value, MetaObject const *schema, std::size_t indent) {
        switch (typeOf(value)) {
        case ValueType::Unset:
            break;
        case ValueType::List:
            elements(as<MetaList>(value), schema, indent);
            break;
        case ValueType::Struct:
            structure(as<MetaStruct>(value), schema, indent);
            break;
        default:
            out_.fill(indent, ' ');
            scalar(value);
            out_.put('\n');
        }
    }

private:
    void scalar(MetaObject const *value) {
        if (typeOf(value) == ValueType::Number) {
            out_.number(as<MetaInt>(value).GetValue());
        } else {
            out_.append(escaped(scalarText(value)));
        }
    }

    void elements(MetaList const &list, MetaObject const *schema, std::size_t indent) {
        Object const element = elementSchema(&list, schema);
        bool first = true;
        for (Object const &each : list.ViewElements()) {
            // A heading sets a nested structure off from the one before; without one, or outermost, a blank line does.
            bool const isStruct = typeOf(each.get()) == ValueType::Struct;
            if (isStruct && !first && (indent == 0 || settings_.header(as<MetaStruct>(each.get())).empty())) {
                out_.put('\n');
            }
            value(each.get(), element.get(), indent);
            first = false;
        }
    }

    void structure(MetaStruct const &structure, MetaObject const *schema, std::size_t indent) {
        std::string const header = settings_.header(structure);
        if (!header.empty()) {
            out_.fill(indent, ' ');
            out_.print(paint_.heading, escaped(header), paint_.end, "\n");
            indent += step;
        }
        std::shared_ptr<StructurePlan const> const plan = plans_.planOf(structure, schema);
        for (FieldPlan const &planned : *plan) {
            field(planned, valueOf(structure, planned), indent);
        }
    }

    void field(FieldPlan const &field, MetaObject const *value, std::size_t indent) {
        ValueType const type = typeOf(value);
        if (type == ValueType::Unset) {
            return;
        }
        out_.fill(indent, ' ');
        out_.print(paint_.label, field.label, ":", paint_.end);
        if (type == ValueType::List || type == ValueType::Struct) {
            out_.put('\n');
            this->value(value, field.schema, indent + step);
        } else {
            out_.put(' ');
            scalar(value);
            if (!field.unit.empty()) {
                out_.print(" ", escaped(field.unit));
            }
            out_.put('\n');
        }
    }

    FormatSettings const &settings_;
    Paint paint_;
    StructurePlans plans_;
    TextBuffer out_;
};

} // namespace

void writeSimple(Result const &result, FormatSettings const &settings, Sink &sink) {
    checkShape(result.value.get(), "simple");
    // A text that is the whole result may bring its line end along.
    if (typeOf(result.value.get()) == ValueType::Text) {
        std::string line = scalarText(result.value.get());
        if (line.ends_with('\n')) {
            line.pop_back();
            SimpleWriter(settings, sink).value(MetaString::New(line).get(), result.schema.get(), 0);
            return;
        }
    }
    SimpleWriter(settings, sink).value(result.value.get(), result.schema.get(), 0);
}

} // namespace Plexa
