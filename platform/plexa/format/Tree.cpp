// SPDX-License-Identifier: Apache-2.0
#include <string>
#include <vector>

#include "Formats.h"
#include "Paint.h"
#include "ResultModel.h"
#include "TextBuffer.h"
#include "plexa/Text.h"

namespace Plexa {

using namespace MetaObj;

namespace {

/// What leads to a node, and what goes on below it.
struct Branch {
    char const *fork;
    char const *corner;
    char const *below;
    char const *blank;
};

constexpr Branch lines = {"├── ", "└── ", "│   ", "    "};
constexpr Branch ascii = {"|-- ", "`-- ", "|   ", "    "};

class TreeWriter {
public:
    TreeWriter(FormatSettings const &settings, Sink &sink)
        : settings_(settings)
        , branch_(settings.display().plain ? ascii : lines)
        , paint_(settings.display())
        , plans_(
              settings, [&settings](std::string const &structure) { return settings.fields(structure); },
              [](std::string const &name) { return escaped(name); })
        , out_(sink) {}

    void result(Result const &result) {
        MetaObject const *const value = result.value.get();
        if (typeOf(value) == ValueType::List) {
            Object const element = elementSchema(&as<MetaList>(value), result.schema.get());
            for (Object const &each : as<MetaList>(value).ViewElements()) {
                node(each.get(), element.get());
            }
        } else {
            node(value, result.schema.get());
        }
    }

private:
    /// A value that no field's name stands before.
    void node(MetaObject const *value, MetaObject const *schema) {
        switch (typeOf(value)) {
        case ValueType::Unset:
            break;
        case ValueType::List:
            out_.append("-\n");
            children(as<MetaList>(value), schema);
            break;
        case ValueType::Struct:
            out_.print(paint_.heading, title(as<MetaStruct>(value)), paint_.end, "\n");
            children(as<MetaStruct>(value), schema);
            break;
        default:
            out_.print(escaped(scalarText(value)), "\n");
        }
    }

    std::string title(MetaStruct const &structure) const {
        std::string const header = settings_.header(structure);
        std::string const shown = escaped(header.empty() ? structure.GetName() : header);
        return shown.empty() ? "-" : shown;
    }

    void field(FieldPlan const &field, MetaObject const *value) {
        ValueType const type = typeOf(value);
        out_.print(paint_.label, field.label);
        if (type == ValueType::List) {
            out_.print(paint_.end, "\n");
            children(as<MetaList>(value), field.schema);
        } else if (type == ValueType::Struct) {
            out_.print(paint_.end, "\n");
            children(as<MetaStruct>(value), field.schema);
        } else {
            out_.print(":", paint_.end, " ", escaped(scalarText(value)));
            out_.print(field.unit.empty() ? "" : " ", escaped(field.unit), "\n");
        }
    }

    void children(MetaList const &list, MetaObject const *schema) {
        Object const element = elementSchema(&list, schema);
        std::vector<Object> const &elements = list.ViewElements();
        std::size_t last = elements.size();
        while (last > 0 && typeOf(elements[last - 1].get()) == ValueType::Unset) {
            --last;
        }
        for (std::size_t i = 0; i < last; ++i) {
            if (typeOf(elements[i].get()) != ValueType::Unset) {
                std::size_t const before = enter(i + 1 == last);
                node(elements[i].get(), element.get());
                prefix_.resize(before);
            }
        }
    }

    void children(MetaStruct const &structure, MetaObject const *schema) {
        std::shared_ptr<StructurePlan const> const plan = plans_.planOf(structure, schema);
        std::size_t last = plan->size();
        while (last > 0 && typeOf(valueOf(structure, (*plan)[last - 1])) == ValueType::Unset) {
            --last;
        }
        for (std::size_t i = 0; i < last; ++i) {
            if (MetaObject const *const value = valueOf(structure, (*plan)[i]); typeOf(value) != ValueType::Unset) {
                std::size_t const before = enter(i + 1 == last);
                field((*plan)[i], value);
                prefix_.resize(before);
            }
        }
    }

    /// Begins the line of a child. Returns the length of the prefix to go back to behind it.
    std::size_t enter(bool isLast) {
        std::size_t const before = prefix_.size();
        out_.print(prefix_, isLast ? branch_.corner : branch_.fork);
        prefix_ += isLast ? branch_.blank : branch_.below;
        return before;
    }

    FormatSettings const &settings_;
    Branch const &branch_;
    Paint paint_;
    StructurePlans plans_;
    TextBuffer out_;
    std::string prefix_;
};

} // namespace

void writeTree(Result const &result, FormatSettings const &settings, Sink &sink) {
    checkShape(result.value.get(), "tree");
    TreeWriter(settings, sink).result(result);
}

} // namespace Plexa
