// SPDX-License-Identifier: Apache-2.0
//
// CSV after RFC 4180: a header line, a line for each structure, lines ended by CR LF. A result that is no structure and
// no list of structures has the one column "result".
//
// CSV has texts alone, so the rest is a convention:
//   unset          an empty cell; an empty text is a quoted one ("")
//   text           a backslash is doubled, a line end stands as it is, any other character that would act on a
//                  terminal is \r, \t, \x1b, \u202e or \U000e0041
//   list, record   the cell is JSON, in one line, as it is
#include <algorithm>
#include <string_view>
#include <vector>

#include <fmt/format.h>

#include "Formats.h"
#include "JsonWriter.h"
#include "MachineWalk.h"
#include "TextBuffer.h"
#include "plexa/Text.h"

namespace Plexa {

using namespace MetaObj;

namespace {

constexpr std::string_view lineEnd = "\r\n";
constexpr std::string_view whole = "result";

/// True for the bytes that stand in an unquoted cell as they are.
bool isPlain(char c) {
    return c >= ' ' && c < '\x7F' && c != '"' && c != ',' && c != '\\';
}

/// A text of the result as the text of a cell.
std::string cellText(std::string_view text) {
    std::string cell;
    cell.reserve(text.size() + 8);
    while (!text.empty()) {
        Character const character = takeCharacter(text);
        if (!character.valid) { // the visible text \xff, as in every format
            fmt::format_to(std::back_inserter(cell), "\\\\x{:02x}", static_cast<unsigned char>(character.bytes[0]));
        } else if (character.code == U'\\') {
            cell += "\\\\";
        } else if (character.code == U'\n') {
            cell += '\n';
        } else {
            cell += escaped(character.bytes);
        }
    }
    return cell;
}

class CsvWriter {
public:
    CsvWriter(FormatSettings const &settings, Sink &sink)
        : plans_(
              settings, [&settings](std::string const &) { return settings.chosenFields(); },
              [](std::string const &name) { return name; })
        , out_(sink)
        , cellWriter_(cell_)
        , cellWalk_("csv", settings, cellWriter_) {}

    void result(Result const &result) {
        MetaObject const *const value = result.value.get();
        MetaObject const *const schema = result.schema.get();
        Kind const kind = kindOf(value, schema);
        if (typeOf(value) == ValueType::Struct) {
            rows({result.value}, schema);
        } else if (typeOf(value) == ValueType::List) {
            Object const element = elementSchema(&as<MetaList>(value), schema);
            std::vector<Object> const &elements = as<MetaList>(value).ViewElements();
            bool const isTable =
                std::all_of(elements.begin(), elements.end(), isRow) && (!elements.empty() || kind == Kind::StructList);
            isTable ? rows(elements, element.get()) : column(elements, element.get());
        } else {
            column({result.value}, schema);
        }
    }

private:
    static bool isRow(Object const &element) {
        return typeOf(element.get()) == ValueType::Struct;
    }

    /// The fields of all rows: a row may hold some that no row before it has.
    StructurePlan columnsOf(std::vector<Object> const &rows, MetaObject const *schema) {
        if (rows.empty() && typeOf(schema) == ValueType::Struct) {
            return *plans_.planOf(as<MetaStruct>(schema), schema);
        }
        StructurePlan columns;
        std::shared_ptr<StructurePlan const> last;
        for (Object const &row : rows) {
            std::shared_ptr<StructurePlan const> const plan = plans_.planOf(as<MetaStruct>(row.get()), schema);
            if (plan != last) {
                merge(columns, *plan);
                last = plan;
            }
        }
        return columns;
    }

    void rows(std::vector<Object> const &rows, MetaObject const *schema) {
        StructurePlan const columns = columnsOf(rows, schema);
        for (std::size_t i = 0; i < columns.size(); ++i) {
            comma(i);
            text(columns[i].name);
        }
        out_.append(lineEnd);
        for (Object const &row : rows) {
            auto const &structure = as<MetaStruct>(row.get());
            for (std::size_t i = 0; i < columns.size(); ++i) {
                comma(i);
                cell(findValue(structure, columns[i]), columns[i].schema);
            }
            out_.append(lineEnd);
        }
    }

    void column(std::vector<Object> const &values, MetaObject const *schema) {
        out_.append(whole);
        out_.append(lineEnd);
        for (Object const &value : values) {
            cell(value.get(), schema);
            out_.append(lineEnd);
        }
    }

    void comma(std::size_t index) {
        if (index > 0) {
            out_.put(',');
        }
    }

    void cell(MetaObject const *value, MetaObject const *schema) {
        switch (typeOf(value)) {
        case ValueType::Unset:
            break;
        case ValueType::Number:
            out_.number(as<MetaInt>(value).GetValue());
            break;
        case ValueType::Text:
            text(as<MetaString>(value).ViewValue());
            break;
        case ValueType::List:
        case ValueType::Struct:
            cell_.clear();
            cellWalk_.nested(value, schema);
            quoted(cell_);
            break;
        default:
            out_.append(scalarText(value));
        }
    }

    void text(std::string_view text) {
        if (!text.empty() && std::all_of(text.begin(), text.end(), isPlain)) {
            // A reader may take blanks at a cell's ends away.
            bool const blanks = text.front() == ' ' || text.back() == ' ';
            blanks ? quoted(text) : out_.append(text);
        } else {
            quoted(cellText(text));
        }
    }

    void quoted(std::string_view text) {
        out_.put('"');
        while (!text.empty()) {
            std::size_t const quote = std::min(text.find('"'), text.size());
            out_.append(text.substr(0, quote));
            out_.append(quote < text.size() ? "\"\"" : "");
            text.remove_prefix(std::min(quote + 1, text.size()));
        }
        out_.put('"');
    }

    using CellWriter = JsonWriter<std::string, JsonLayout::OneLine>;

    StructurePlans plans_;
    TextBuffer out_;
    std::string cell_;
    CellWriter cellWriter_;
    MachineWalk<CellWriter> cellWalk_;
};

} // namespace

void writeCsv(Result const &result, FormatSettings const &settings, Sink &sink) {
    checkShape(result.value.get(), "csv");
    CsvWriter(settings, sink).result(result);
}

} // namespace Plexa
