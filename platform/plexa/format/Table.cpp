// SPDX-License-Identifier: Apache-2.0
//
// A table takes two walks over its rows: one for the widths of its columns, one to write. Nothing of a row is kept
// between them.
#include <algorithm>

#include "Formats.h"
#include "Paint.h"
#include "ResultModel.h"
#include "TableLayout.h"
#include "TextBuffer.h"
#include "plexa/Text.h"

namespace Plexa {

using namespace MetaObj;

namespace {

constexpr std::size_t step = 2;

/// A cell in one line. The text may lie in the value or in the room that was given for it.
struct Shown {
    std::string_view text;
    std::size_t width = 0;
};

bool isCollection(MetaObject const *value) {
    ValueType const type = typeOf(value);
    return type == ValueType::List || type == ValueType::Struct;
}

/// True for what cannot stand in a cell: structures, and lists that hold more than single values.
bool needsRoomOfItsOwn(MetaObject const *value) {
    if (typeOf(value) != ValueType::List) {
        return typeOf(value) == ValueType::Struct;
    }
    std::vector<Object> const &elements = as<MetaList>(value).ViewElements();
    return std::any_of(elements.begin(), elements.end(), [](Object const &each) { return isCollection(each.get()); });
}

Shown shown(MetaObject const *value, std::string const &unit, std::string &room) {
    ValueType const type = typeOf(value);
    if (type == ValueType::Unset) {
        return {};
    }
    if (type == ValueType::Text && unit.empty() && isPlainAscii(as<MetaString>(value).ViewValue())) {
        std::string const &text = as<MetaString>(value).ViewValue();
        return {text, text.size()};
    }
    room = escaped(scalarText(value));
    if (!unit.empty()) {
        room += ' ';
        room += escaped(unit);
    }
    return {room, displayWidth(room)};
}

class TableWriter {
public:
    TableWriter(FormatSettings const &settings, Sink &sink)
        : settings_(settings)
        , paint_(settings.display())
        , outermost_(
              settings,
              [&settings](std::string const &structure) {
                  std::optional<std::vector<std::string>> columns = settings.tableColumns();
                  return columns ? columns : settings.fields(structure);
              },
              escapedName)
        , nested_(
              settings, [&settings](std::string const &structure) { return settings.fields(structure); }, escapedName)
        , out_(sink) {}

    void result(Result const &result) {
        value(result.value, result.schema.get(), true, 0);
    }

private:
    static std::string escapedName(std::string const &name) {
        return escaped(name);
    }

    /// What stands on lines of its own: a table, or values one below the other.
    void value(Object const &value, MetaObject const *schema, bool outermost, std::size_t indent) {
        switch (typeOf(value.get())) {
        case ValueType::Unset:
            break;
        case ValueType::Struct:
            table({value}, schema, outermost, indent);
            break;
        case ValueType::List:
            list(as<MetaList>(value.get()), schema, outermost, indent);
            break;
        default:
            out_.fill(indent, ' ');
            out_.print(shown(value.get(), std::string(), room_).text, "\n");
        }
    }

    void list(MetaList const &list, MetaObject const *schema, bool outermost, std::size_t indent) {
        Object const element = elementSchema(&list, schema);
        std::vector<Object> const &elements = list.ViewElements();
        bool const rows = std::all_of(elements.begin(), elements.end(),
                                      [](Object const &each) { return typeOf(each.get()) == ValueType::Struct; });
        if (rows && (!elements.empty() || typeOf(element.get()) == ValueType::Struct)) {
            table(elements, element.get(), outermost, indent);
            return;
        }
        for (Object const &each : elements) {
            value(each, element.get(), outermost, isCollection(each.get()) ? indent + step : indent);
        }
    }

    void table(std::vector<Object> const &rows, MetaObject const *schema, bool outermost, std::size_t indent) {
        StructurePlan apart; // fields that stand below their row
        std::vector<Column> columns = columnsOf(rows, schema, outermost, apart);
        if (settings_.display().width > 0) {
            fitColumns(columns, settings_.display().width - std::min(settings_.display().width, indent));
        }
        heading(columns, indent);
        for (Object const &row : rows) {
            auto const &structure = as<MetaStruct>(row.get());
            printRow(structure, columns, indent);
            for (Column const &column : columns) {
                if (needsRoomOfItsOwn(findValue(structure, column.field))) {
                    below(structure, column.field, indent + step);
                }
            }
            for (FieldPlan const &field : apart) {
                below(structure, field, indent + step);
            }
        }
    }

    std::vector<Column> columnsOf(std::vector<Object> const &rows, MetaObject const *schema, bool outermost,
                                  StructurePlan &apart) {
        StructurePlans &plans = outermost ? outermost_ : nested_;
        StructurePlan fields;
        std::shared_ptr<StructurePlan const> last;
        if (rows.empty()) {
            fields = *plans.planOf(as<MetaStruct>(schema), schema);
        }
        for (Object const &row : rows) {
            std::shared_ptr<StructurePlan const> const plan = plans.planOf(as<MetaStruct>(row.get()), schema);
            if (plan != last) {
                merge(fields, *plan);
                last = plan;
            }
        }
        std::vector<Column> columns;
        for (FieldPlan const &field : fields) {
            Kind const kind = kindOf(nullptr, field.schema.get());
            if (kind == Kind::StructList || kind == Kind::Struct) {
                apart.push_back(field);
            } else {
                columns.push_back({field, displayWidth(field.label), kind == Kind::Number});
            }
        }
        for (Object const &row : rows) {
            for (Column &column : columns) {
                column.width = std::max(column.width, widthOf(as<MetaStruct>(row.get()), column));
            }
        }
        return columns;
    }

    std::size_t widthOf(MetaStruct const &row, Column const &column) {
        MetaObject const *const value = findValue(row, column.field);
        if (!isCollection(value)) {
            return shown(value, column.field.unit, room_).width;
        }
        std::size_t width = 0;
        if (!needsRoomOfItsOwn(value)) {
            for (Object const &element : as<MetaList>(value).ViewElements()) {
                width = std::max(width, shown(element.get(), std::string(), room_).width);
            }
        }
        return width;
    }

    void heading(std::vector<Column> const &columns, std::size_t indent) {
        std::vector<std::vector<std::string>> titles;
        std::vector<std::vector<std::string>> rules;
        for (Column const &column : columns) {
            titles.push_back(brokenToWidth(column.field.label, column.width));
            rules.push_back({std::string(column.width, '-')});
        }
        printLines(titles, columns, indent, paint_.heading);
        printLines(rules, columns, indent, {});
    }

    void printRow(MetaStruct const &row, std::vector<Column> const &columns, std::size_t indent) {
        if (rooms_.size() < columns.size()) {
            rooms_.resize(columns.size());
            cells_.resize(columns.size());
        }
        for (std::size_t i = 0; i < columns.size(); ++i) {
            MetaObject const *const value = findValue(row, columns[i].field);
            cells_[i] = isCollection(value) ? Shown() : shown(value, columns[i].field.unit, rooms_[i]);
            if (isCollection(value) || cells_[i].width > columns[i].width) {
                printTallRow(row, columns, indent);
                return;
            }
        }
        std::size_t owed = indent; // blanks due before the next text, so that no line ends in any
        for (std::size_t i = 0; i < columns.size(); ++i) {
            put(cells_[i].text, cells_[i].width, columns[i], {}, owed);
        }
        out_.put('\n');
    }

    void printTallRow(MetaStruct const &row, std::vector<Column> const &columns, std::size_t indent) {
        std::vector<std::vector<std::string>> cells;
        for (Column const &column : columns) {
            cells.push_back(linesOf(findValue(row, column.field), column));
        }
        printLines(cells, columns, indent, {});
    }

    /// A list of values stands in its cell one below the other.
    std::vector<std::string> linesOf(MetaObject const *value, Column const &column) {
        if (!isCollection(value)) {
            return brokenToWidth(shown(value, column.field.unit, room_).text, column.width);
        }
        std::vector<std::string> lines;
        if (!needsRoomOfItsOwn(value)) {
            for (Object const &element : as<MetaList>(value).ViewElements()) {
                for (std::string const &line :
                     brokenToWidth(shown(element.get(), std::string(), room_).text, column.width)) {
                    lines.push_back(line);
                }
            }
        }
        return lines;
    }

    void printLines(std::vector<std::vector<std::string>> const &cells, std::vector<Column> const &columns,
                    std::size_t indent, std::string_view colour) {
        std::size_t height = 1;
        for (std::vector<std::string> const &cell : cells) {
            height = std::max(height, cell.size());
        }
        for (std::size_t line = 0; line < height; ++line) {
            std::size_t owed = indent;
            for (std::size_t i = 0; i < columns.size(); ++i) {
                std::string_view const text = line < cells[i].size() ? std::string_view(cells[i][line]) : "";
                put(text, displayWidth(text), columns[i], colour, owed);
            }
            out_.put('\n');
        }
    }

    void put(std::string_view text, std::size_t width, Column const &column, std::string_view colour,
             std::size_t &owed) {
        std::size_t const padding = column.width - std::min(column.width, width);
        owed += column.isNumber ? padding : 0;
        if (!text.empty()) {
            out_.fill(owed, ' ');
            out_.append(colour);
            out_.append(text);
            out_.append(colour.empty() ? "" : paint_.end);
            owed = 0;
        }
        owed += (column.isNumber ? 0 : padding) + columnGap;
    }

    void below(MetaStruct const &row, FieldPlan const &field, std::size_t indent) {
        Object const value = row.GetField(field.name);
        bool const isEmptyList =
            typeOf(value.get()) == ValueType::List && as<MetaList>(value.get()).ViewElements().empty();
        if (typeOf(value.get()) == ValueType::Unset || isEmptyList) {
            return;
        }
        std::string const header = settings_.header(row);
        out_.fill(indent, ' ');
        out_.print(paint_.label, field.label, header.empty() ? "" : " of ", escaped(header), ":", paint_.end, "\n");
        this->value(value, field.schema.get(), false, indent + step);
    }

    FormatSettings const &settings_;
    Paint paint_;
    StructurePlans outermost_; // of these the columns may be chosen for the table alone
    StructurePlans nested_;
    TextBuffer out_;
    std::string room_;
    std::vector<std::string> rooms_;
    std::vector<Shown> cells_;
};

} // namespace

void writeTable(Result const &result, FormatSettings const &settings, Sink &sink) {
    TableWriter(settings, sink).result(result);
}

} // namespace Plexa
