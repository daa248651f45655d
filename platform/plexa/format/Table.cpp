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
    FieldView field; ///< its name and schema; no value
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
        for (std::string const &line : cell({std::string(), result.value, result.schema}, std::string())) {
            out_.print("{}\n", line);
        }
    }

    void table(std::vector<Object> const &rows, Object const &schema, Names names, std::size_t indent) {
        Object const declared = schema != nullptr || rows.empty() ? schema : rows.front();
        std::string const name = structureName(Object(), declared);
        if (!names) {
            names = settings_.fields(name);
        }
        std::vector<FieldView> fields = fieldsOf(Object(), declared);
        if (names) {
            fields = selected(fields, *names);
        }
        std::vector<Column> columns;
        std::vector<FieldView> nested;
        for (FieldView const &field : fields) {
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
            cells.push_back(cellsOf(row, columns, name));
        }
        heading(columns, indent);
        for (std::size_t i = 0; i < rows.size(); ++i) {
            printRow(cells[i], columns, indent);
            for (FieldView const &field : nested) {
                nestedTable(rows[i], field, indent + step);
            }
        }
    }

    std::vector<Cell> cellsOf(Object const &row, std::vector<Column> &columns, std::string const &structure) {
        auto const made = boost::dynamic_pointer_cast<MetaStruct>(row);
        std::vector<Cell> cells;
        for (Column &column : columns) {
            Object const value = made != nullptr ? made->GetField(column.field.name) : Object();
            cells.push_back(
                cell({column.field.name, value, column.field.schema}, settings_.unit(structure, column.field.name)));
            for (std::string const &line : cells.back()) {
                column.width = std::max(column.width, displayWidth(line));
            }
        }
        return cells;
    }

    static Cell cell(FieldView const &field, std::string const &unit) {
        Cell lines;
        if (auto const list = boost::dynamic_pointer_cast<MetaList>(field.value)) {
            for (Object const &element : list->GetElements()) {
                lines.push_back(escaped(scalarText(element)));
            }
        } else if (isSet(field.value)) {
            lines.push_back(escaped(scalarText(field.value)) + (unit.empty() ? "" : " " + escaped(unit)));
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

    void nestedTable(Object const &row, FieldView const &field, std::size_t indent) {
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
