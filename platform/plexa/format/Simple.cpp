// SPDX-License-Identifier: Apache-2.0
#include "Formats.h"
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
        , plans_(settings, [&settings](std::string const &structure) { return settings.fields(structure); })
        , out_(sink) {}

    void value(Object const &value, Object const &schema, std::size_t indent) {
        switch (kindOf(value, schema)) {
        case Kind::Nothing:
            break;
        case Kind::Scalar:
        case Kind::Number:
            if (isSet(value)) {
                out_.print("{:{}}{}\n", "", indent, escaped(scalarText(value)));
            }
            break;
        case Kind::ScalarList:
        case Kind::StructList:
            elements(value, schema, indent);
            break;
        case Kind::Struct:
            structure(value, schema, indent);
            break;
        }
    }

private:
    void elements(Object const &list, Object const &schema, std::size_t indent) {
        auto const made = boost::dynamic_pointer_cast<MetaList>(list);
        if (made == nullptr) {
            return;
        }
        Object const element = elementSchema(list, schema);
        bool first = true;
        for (Object const &each : made->GetElements()) {
            // A heading sets a nested structure off from the one before; without one, or outermost, a blank line does.
            auto const asStruct = boost::dynamic_pointer_cast<MetaStruct>(each);
            if (asStruct != nullptr && !first && (indent == 0 || settings_.header(*asStruct).empty())) {
                out_.print("\n");
            }
            value(each, element, indent);
            first = false;
        }
    }

    void structure(Object const &object, Object const &schema, std::size_t indent) {
        auto const made = boost::dynamic_pointer_cast<MetaStruct>(object);
        if (made == nullptr) {
            return;
        }
        std::string const header = settings_.header(*made);
        if (!header.empty()) {
            out_.print("{:{}}{}\n", "", indent, escaped(header));
            indent += step;
        }
        std::shared_ptr<StructurePlan const> const plan = plans_.planOf(*made, schema);
        for (FieldPlan const &planned : *plan) {
            field(planned, made->GetField(planned.name), indent);
        }
    }

    void field(FieldPlan const &field, Object const &value, std::size_t indent) {
        if (!isSet(value)) {
            return;
        }
        Kind const kind = kindOf(value, field.schema);
        if (kind == Kind::Scalar || kind == Kind::Number) {
            out_.print("{:{}}{}: {}{}{}\n", "", indent, escaped(field.name), escaped(scalarText(value)),
                       field.unit.empty() ? "" : " ", escaped(field.unit));
        } else {
            out_.print("{:{}}{}:\n", "", indent, escaped(field.name));
            this->value(value, field.schema, indent + step);
        }
    }

    FormatSettings const &settings_;
    StructurePlans plans_;
    TextBuffer out_;
};

} // namespace

void writeSimple(Result const &result, FormatSettings const &settings, Sink &sink) {
    // A text that is the whole result may bring its line end along.
    if (auto const text = boost::dynamic_pointer_cast<MetaString>(result.value);
        text != nullptr && text->IsSet() && text->GetValue().ends_with('\n')) {
        std::string line = text->GetValue();
        line.pop_back();
        SimpleWriter(settings, sink).value(MetaString::New(line), result.schema, 0);
        return;
    }
    SimpleWriter(settings, sink).value(result.value, result.schema, 0);
}

} // namespace Plexa
