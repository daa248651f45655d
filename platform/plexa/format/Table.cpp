// SPDX-License-Identifier: Apache-2.0
#include <algorithm>

#include "Formats.h"
#include "ResultModel.h"
#include "TextBuffer.h"
#include "plexa/Text.h"

namespace Plexa {

using namespace MetaObj;

namespace {

constexpr std::size_t step = 2;
constexpr std::size_t gap = 2;

/// A list of texts stands in its cell one below the other.
using Cell = std::vector<std::string>;

struct Column {
    FieldPlan field;
    std::string title;
    std::size_t width = 0;
    bool isNumber = false;
};

class TableWriter {
public:
    TableWriter(FormatSettings const &settings, Sink &sink)
        : settings_(settings)
        , out_(sink) {}

    void result(Result const &result) {
        Kind const kind = kindOf(result.value, result.schema);
        if (kind == Kind::Struct) {
            table({result.value}, result.schema, settings_.tableColumns(), 0);
        } else if (kind == Kind::StructList) {
            list(result.value, result.schema, settings_.tableColumns(), 0);
        } else {
            writeRest(result);
        }
    }

private:
    using Names = std::optional<std::vector<std::string>>;

    void list(Object const &object, Object const &schema, Names const &columns, std::size_t indent) {
        auto const made = boost::dynamic_pointer_cast<MetaList>(object);
        if (made != nullptr) {
            table(made->GetElements(), elementSchema(object, schema), columns, indent);
        }
    }

    /// What is no table: a value, or a list of values one below the other.
    void writeRest(Result const &result) {
        for (std::string const &line : cell(result.value, std::string())) {
            out_.print("{}\n", line);
        }
    }

    void table(std::vector<Object> const &rows, Object const &schema, Names const &names, std::size_t indent) {
        Object const declared = schema != nullptr || rows.empty() ? schema : rows.front();
        auto const structure = boost::dynamic_pointer_cast<MetaStruct>(declared);
        if (structure == nullptr) {
            return; // an empty list of nobody knows what
        }
        StructurePlans plans(settings_,
                             [&](std::string const &name) { return names ? names : settings_.fields(name); });
        std::shared_ptr<StructurePlan const> const plan = plans.planOf(*structure, declared);
        std::vector<Column> columns;
        StructurePlan nested;
        for (FieldPlan const &field : *plan) {
            if (kindOf(Object(), field.schema) == Kind::StructList) {
                nested.push_back(field);
            } else {
                std::string const title = escaped(field.name);
                bool const isNumber = kindOf(Object(), field.schema) == Kind::Number;
                columns.push_back({field, title, displayWidth(title), isNumber});
            }
        }

        std::vector<std::vector<Cell>> cells;
        cells.reserve(rows.size());
        for (Object const &row : rows) {
            cells.push_back(cellsOf(row, columns));
        }
        heading(columns, indent);
        for (std::size_t i = 0; i < rows.size(); ++i) {
            printRow(cells[i], columns, indent);
            for (FieldPlan const &field : nested) {
                nestedTable(rows[i], field, indent + step);
            }
        }
    }

    static std::vector<Cell> cellsOf(Object const &row, std::vector<Column> &columns) {
        auto const made = boost::dynamic_pointer_cast<MetaStruct>(row);
        std::vector<Cell> cells;
        cells.reserve(columns.size());
        for (Column &column : columns) {
            cells.push_back(cell(made != nullptr ? made->GetField(column.field.name) : Object(), column.field.unit));
            for (std::string const &line : cells.back()) {
                column.width = std::max(column.width, displayWidth(line));
            }
        }
        return cells;
    }

    static Cell cell(Object const &value, std::string const &unit) {
        Cell lines;
        if (auto const list = boost::dynamic_pointer_cast<MetaList>(value)) {
            for (Object const &element : list->GetElements()) {
                lines.push_back(escaped(scalarText(element)));
            }
        } else if (isSet(value)) {
            lines.push_back(escaped(scalarText(value)) + (unit.empty() ? "" : " " + escaped(unit)));
        }
        return lines;
    }

    void heading(std::vector<Column> const &columns, std::size_t indent) {
        std::vector<Cell> titles;
        std::vector<Cell> rules;
        for (Column const &column : columns) {
            titles.push_back({column.title});
            rules.push_back({std::string(column.width, '-')});
        }
        printRow(titles, columns, indent);
        printRow(rules, columns, indent);
    }

    void printRow(std::vector<Cell> const &cells, std::vector<Column> const &columns, std::size_t indent) {
        std::size_t height = 1;
        for (Cell const &each : cells) {
            height = std::max(height, each.size());
        }
        for (std::size_t line = 0; line < height; ++line) {
            std::string text;
            std::size_t owed = indent; // blanks due before the next text, so that no line ends in any
            for (std::size_t i = 0; i < columns.size(); ++i) {
                std::string const &shown = line < cells[i].size() ? cells[i][line] : empty_;
                std::size_t const padding = columns[i].width - displayWidth(shown);
                owed += columns[i].isNumber ? padding : 0;
                if (!shown.empty()) {
                    text.append(owed, ' ');
                    text += shown;
                    owed = 0;
                }
                owed += (columns[i].isNumber ? 0 : padding) + gap;
            }
            out_.print("{}\n", text);
        }
    }

    void nestedTable(Object const &row, FieldPlan const &field, std::size_t indent) {
        auto const made = boost::dynamic_pointer_cast<MetaStruct>(row);
        Object const value = made != nullptr ? made->GetField(field.name) : Object();
        auto const nested = boost::dynamic_pointer_cast<MetaList>(value);
        if (nested == nullptr || nested->GetElements().empty()) {
            return;
        }
        std::string const header = settings_.header(*made);
        out_.print("{:{}}{}{}{}:\n", "", indent, escaped(field.name), header.empty() ? "" : " of ", escaped(header));
        list(value, field.schema, std::nullopt, indent + step);
    }

    FormatSettings const &settings_;
    TextBuffer out_;
    std::string const empty_;
};

} // namespace

void writeTable(Result const &result, FormatSettings const &settings, Sink &sink) {
    TableWriter(settings, sink).result(result);
}

} // namespace Plexa
