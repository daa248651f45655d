// SPDX-License-Identifier: Apache-2.0
//
// A table takes two walks over its rows: one for the widths of its columns, one to write. Nothing of a row is kept
// between them.
#include <algorithm>
#include <charconv>

#include "Formats.h"
#include "Paint.h"
#include "ResultModel.h"
#include "TableLayout.h"
#include "TextBuffer.h"
#include "plexa/Text.h"

namespace Plexa {

using namespace MetaObj;

namespace {

constexpr char const *format = "table";
constexpr std::size_t step = 2;
constexpr std::size_t longestNumber = 24;

/// A cell in one line. The text may lie in the value or in the room that was given for it.
struct Shown {
    std::string_view text;
    std::size_t width = 0;
};

/// What the walk for the widths found out about a table.
struct Layout {
    StructurePlan fields;        ///< all of them, over all rows
    std::vector<Column> columns; ///< those that have one
    StructurePlan apart;         ///< those that stand below their row
    bool isUniform = true;       ///< every row holds the same fields in the same places
};

bool isCollection(ValueType type) {
    return type == ValueType::List || type == ValueType::Struct;
}

bool isCollection(MetaObject const *value) {
    return isCollection(typeOf(value));
}

/// True for what cannot stand in a cell: structures, and lists that hold more than single values.
bool needsRoomOfItsOwn(MetaObject const *value) {
    if (typeOf(value) != ValueType::List) {
        return typeOf(value) == ValueType::Struct;
    }
    std::vector<Object> const &elements = as<MetaList>(value).ViewElements();
    return std::any_of(elements.begin(), elements.end(), [](Object const &each) { return isCollection(each.get()); });
}

/// Of anything but a text that can be shown as it is.
Shown shownElsewise(MetaObject const *value, ValueType type, std::string const &unit, std::string &room) {
    if (type == ValueType::Unset) {
        return {};
    }
    if (type == ValueType::Boolean && unit.empty()) {
        std::string_view const text = as<MetaBool>(value).GetValue() ? "true" : "false";
        return {text, text.size()};
    }
    if (type == ValueType::Number) {
        room.resize(longestNumber);
        auto const [end, error] = std::to_chars(room.data(), room.data() + room.size(), as<MetaInt>(value).GetValue());
        room.resize(static_cast<std::size_t>(end - room.data()));
    } else {
        room = escaped(scalarText(value));
    }
    if (!unit.empty()) {
        room += ' ';
        room += escaped(unit);
    }
    return {room, displayWidth(room)};
}

/// @param type the value's
inline Shown shown(MetaObject const *value, ValueType type, std::string const &unit, std::string &room) {
    if (type == ValueType::Text && unit.empty()) {
        std::string_view const text = as<MetaString>(value).ViewValue();
        if (isPlainAscii(text)) {
            return {text, text.size()};
        }
    }
    return shownElsewise(value, type, unit, room);
}

Shown shown(MetaObject const *value, std::string const &unit, std::string &room) {
    return shown(value, typeOf(value), unit, room);
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

    /// The rows of a list are checked by the walk for the widths, all else by one of its own.
    void result(Result const &result) {
        if (typeOf(result.value.get()) != ValueType::List) {
            checkShape(result.value.get(), format);
        }
        value(result.value.get(), result.schema.get(), true, 0);
    }

private:
    static std::string escapedName(std::string const &name) {
        return escaped(name);
    }

    /// What stands on lines of its own: a table, or values one below the other.
    void value(MetaObject const *value, MetaObject const *schema, bool outermost, std::size_t indent) {
        switch (typeOf(value)) {
        case ValueType::Unset:
            break;
        case ValueType::Struct:
            static_cast<void>(table(Rows(as<MetaStruct>(value)), schema, outermost, indent));
            break;
        case ValueType::List:
            list(as<MetaList>(value), schema, outermost, indent);
            break;
        default:
            out_.fill(indent, ' ');
            out_.print(shown(value, std::string(), room_).text, "\n");
        }
    }

    void list(MetaList const &list, MetaObject const *schema, bool outermost, std::size_t indent) {
        Object const element = elementSchema(&list, schema);
        std::vector<Object> const &elements = list.ViewElements();
        bool const isDeclared = typeOf(element.get()) == ValueType::Struct;
        if ((!elements.empty() || isDeclared) && table(Rows(elements), element.get(), outermost, indent)) {
            return;
        }
        checkShape(&list, format);
        for (Object const &each : elements) {
            value(each.get(), element.get(), outermost, isCollection(each.get()) ? indent + step : indent);
        }
    }

    /// @return false, and nothing is written, when a row is no structure
    bool table(Rows const &rows, MetaObject const *schema, bool outermost, std::size_t indent) {
        Layout layout;
        if (!findColumns(rows, schema, outermost ? outermost_ : nested_, layout)) {
            return false;
        }
        std::vector<Column> &columns = layout.columns;
        if (settings_.display().width > 0) {
            fitColumns(columns, settings_.display().width - std::min(settings_.display().width, indent));
        }
        heading(columns, indent);
        for (std::size_t place = 0; place < rows.size(); ++place) {
            auto const &structure = as<MetaStruct>(rows[place]);
            bool const isFlat = printRow(structure, layout, indent);
            for (std::size_t i = 0; !isFlat && i < columns.size(); ++i) {
                if (needsRoomOfItsOwn(findValue(structure, columns[i].field))) {
                    below(structure, columns[i].field, indent + step);
                }
            }
            for (FieldPlan const &field : layout.apart) {
                below(structure, field, indent + step);
            }
        }
        return true;
    }

    /// The walk for the widths. A row may hold fields that no row before it has.
    bool findColumns(Rows const &rows, MetaObject const *schema, StructurePlans &plans, Layout &layout) {
        if (rows.size() == 0) {
            addColumns(*plans.planOf(as<MetaStruct>(schema), schema), layout);
        }
        std::shared_ptr<StructurePlan const> first;
        std::shared_ptr<StructurePlan const> last;
        for (std::size_t place = 0; place < rows.size(); ++place) {
            if (typeOf(rows[place]) != ValueType::Struct) {
                return false;
            }
            auto const &structure = as<MetaStruct>(rows[place]);
            std::shared_ptr<StructurePlan const> const plan = plans.planOf(structure, schema);
            if (plan != last) {
                addColumns(*plan, layout);
                layout.isUniform = first == nullptr;
                first = first == nullptr ? plan : first;
                last = plan;
            }
            MetaStruct::Fields const fields = structure.ViewFields();
            for (Column &column : layout.columns) {
                MetaObject const *const value =
                    plan == first ? valueOf(fields, column.field) : findValue(structure, column.field);
                ValueType const type = typeOf(value);
                requireShape(value, type, column.field);
                column.width = std::max(column.width, widthOf(value, type, column.field.unit));
            }
            for (FieldPlan const &field : layout.apart) {
                MetaObject const *const value = findValue(structure, field);
                requireShape(value, typeOf(value), field);
            }
        }
        return true;
    }

    static void requireShape(MetaObject const *value, ValueType type, FieldPlan const &field) {
        if (isCollection(type)) {
            checkShape(value, format, &field.name);
        } else if (type == ValueType::Unknown) {
            refuse(format, &field.name, isOfUnknownKind);
        }
    }

    static void addColumns(StructurePlan const &plan, Layout &layout) {
        std::size_t const before = layout.fields.size();
        merge(layout.fields, plan);
        for (std::size_t i = before; i < layout.fields.size(); ++i) {
            FieldPlan const &field = layout.fields[i];
            Kind const kind = kindOf(nullptr, field.schema);
            if (kind == Kind::StructList || kind == Kind::Struct) {
                layout.apart.push_back(field);
            } else {
                layout.columns.push_back({field, displayWidth(field.label), kind == Kind::Number});
            }
        }
    }

    std::size_t widthOf(MetaObject const *value, ValueType type, std::string const &unit) {
        if (!isCollection(type)) {
            return shown(value, type, unit, room_).width;
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

    /// @return false when a cell is a list or a structure
    bool printRow(MetaStruct const &row, Layout const &layout, std::size_t indent) {
        std::vector<Column> const &columns = layout.columns;
        if (rooms_.size() < columns.size()) {
            rooms_.resize(columns.size());
            cells_.resize(columns.size());
        }
        bool isFlat = true;
        bool isTall = false;
        MetaStruct::Fields const fields = row.ViewFields();
        for (std::size_t i = 0; i < columns.size(); ++i) {
            MetaObject const *const value =
                layout.isUniform ? valueOf(fields, columns[i].field) : findValue(row, columns[i].field);
            ValueType const type = typeOf(value);
            if (isCollection(type)) {
                isFlat = false;
            } else {
                cells_[i] = shown(value, type, columns[i].field.unit, rooms_[i]);
                isTall = isTall || cells_[i].width > columns[i].width;
            }
        }
        if (isTall || !isFlat) {
            printTallRow(row, columns, indent);
            return isFlat;
        }
        std::size_t owed = indent; // blanks due before the next text, so that no line ends in any
        for (std::size_t i = 0; i < columns.size(); ++i) {
            Shown const &cell = cells_[i];
            std::size_t const padding = columns[i].width - cell.width;
            owed += columns[i].isNumber ? padding : 0;
            if (!cell.text.empty()) {
                out_.fill(owed, ' ');
                out_.append(cell.text);
                owed = 0;
            }
            owed += (columns[i].isNumber ? 0 : padding) + columnGap;
        }
        out_.put('\n');
        return true;
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
        MetaObject const *const value = findValue(row, field);
        bool const isEmptyList = typeOf(value) == ValueType::List && as<MetaList>(value).ViewElements().empty();
        if (typeOf(value) == ValueType::Unset || isEmptyList) {
            return;
        }
        std::string const header = settings_.header(row);
        out_.fill(indent, ' ');
        out_.print(paint_.label, field.label, header.empty() ? "" : " of ", escaped(header), ":", paint_.end, "\n");
        this->value(value, field.schema, false, indent + step);
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
