// SPDX-License-Identifier: Apache-2.0
#include "CaseValues.h"

#include <array>

#include "SetField.h"

namespace FormatCases {

using namespace Plexa::MetaObj;

namespace {

std::string every(unsigned first, unsigned last) {
    std::string text;
    for (unsigned byte = first; byte <= last; ++byte) {
        text += static_cast<char>(byte);
    }
    return text;
}

template <typename Value>
boost::shared_ptr<Value> as(Object const &object) {
    return boost::dynamic_pointer_cast<Value>(object);
}

unsigned below(std::mt19937 &generator, unsigned limit) {
    return static_cast<unsigned>(generator() % limit);
}

std::string randomText(std::mt19937 &generator) {
    std::vector<std::string> const &tricky = trickyTexts();
    if (below(generator, 3) == 0) {
        return tricky[below(generator, static_cast<unsigned>(tricky.size()))];
    }
    std::array<std::string, 24> const pieces = {
        "a",    "Z",       "0",  " ", ":",   ": ", "#",  "-",    "\n",       "\r",           "\"",
        "'",    ",",       "\\", "<", "]]>", "&",  "\t", "\x1b", "\xC3\xA9", "\xE2\x80\xAE", "\xF0\x9F\x98\x80",
        "\xFF", "\xE2\x82"};
    std::string text;
    for (unsigned left = below(generator, 12); left > 0; --left) {
        text += pieces[below(generator, pieces.size())];
    }
    return text;
}

} // namespace

std::vector<std::string> const &trickyTexts() {
    static std::vector<std::string> const texts = {"",
                                                   " ",
                                                   "  leading",
                                                   "trailing  ",
                                                   "plain",
                                                   "two words",
                                                   "-",
                                                   "--",
                                                   "---",
                                                   "...",
                                                   "?",
                                                   ":",
                                                   "a:",
                                                   ":a",
                                                   "a: b",
                                                   "a:b",
                                                   "a #b",
                                                   "a#b",
                                                   "#a",
                                                   "- a",
                                                   "? a",
                                                   "&a",
                                                   "*a",
                                                   "!a",
                                                   "|",
                                                   ">",
                                                   "%a",
                                                   "@a",
                                                   "`a",
                                                   "[a]",
                                                   "{a}",
                                                   "a,b",
                                                   "[]",
                                                   "{}",
                                                   "null",
                                                   "Null",
                                                   "NULL",
                                                   "~",
                                                   "none",
                                                   "true",
                                                   "True",
                                                   "FALSE",
                                                   "yes",
                                                   "Yes",
                                                   "no",
                                                   "NO",
                                                   "on",
                                                   "Off",
                                                   "y",
                                                   "N",
                                                   "inf",
                                                   ".inf",
                                                   "-.INF",
                                                   ".nan",
                                                   "nan",
                                                   "0",
                                                   "007",
                                                   "0o17",
                                                   "0x1F",
                                                   "0b11",
                                                   "1_000",
                                                   "+1",
                                                   "-0",
                                                   "1.0",
                                                   "1e5",
                                                   "1.0e+5",
                                                   ".5",
                                                   "5.",
                                                   "12:30:45",
                                                   "190:20:30",
                                                   "2001-12-14",
                                                   "2001-12-14t21:59:43.10-05:00",
                                                   "<<",
                                                   "=",
                                                   "9223372036854775807",
                                                   "9223372036854775808",
                                                   "e5",
                                                   "1e999",
                                                   "result",
                                                   "key=value",
                                                   "=1+2",
                                                   "+cmd",
                                                   "@x",
                                                   "a\"b",
                                                   "\"",
                                                   "\"\"",
                                                   "'",
                                                   "''",
                                                   "it's",
                                                   "a'b\"c",
                                                   "\\",
                                                   "\\n",
                                                   "\\\\",
                                                   "C:\\new",
                                                   "\\xff",
                                                   "\\u202e",
                                                   "a\\",
                                                   "\n",
                                                   "\r",
                                                   "\r\n",
                                                   "a\nb",
                                                   "a\r\nb",
                                                   "a\rb",
                                                   "\na",
                                                   "a\n",
                                                   "a\n\n",
                                                   "\ta",
                                                   "a\tb",
                                                   "a\n  b\n c",
                                                   " \n ",
                                                   "<",
                                                   ">",
                                                   "&",
                                                   "<a>",
                                                   "]]>",
                                                   "<![CDATA[a]]>",
                                                   "&amp;",
                                                   "&#1;",
                                                   "<!--a-->",
                                                   "--\n---\n...\n",
                                                   "a;b",
                                                   "$(a)",
                                                   "%s",
                                                   std::string("\0", 1),
                                                   std::string("a\0b", 3),
                                                   every(1, 31),
                                                   every(32, 126),
                                                   every(127, 159),
                                                   every(128, 255),
                                                   "\x1b[31mred\x1b[0m",
                                                   "\x1b]0;title\x07",
                                                   "\x7f",
                                                   "\xC2\x85",
                                                   "\xC2\xA0",
                                                   "\xC2\x9B",
                                                   "\xE2\x80\xA8",
                                                   "\xE2\x80\xA9",
                                                   "\xE2\x80\xAE",
                                                   "\xE2\x81\xA6",
                                                   "\xEF\xBB\xBF",
                                                   "\xEF\xBB\xBF"
                                                   "a",
                                                   "\xEF\xBF\xBD",
                                                   "\xEF\xBF\xBE",
                                                   "\xEF\xBF\xBF",
                                                   "\xF0\x9F\xBF\xBE",
                                                   "\xF4\x8F\xBF\xBF",
                                                   "\xF3\xA0\x81\x81",
                                                   "\xED\xA0\x80",
                                                   "\xC0\x80",
                                                   "\xE2\x82",
                                                   "\xFF\xFE",
                                                   "a\xFF"
                                                   "b",
                                                   "\xF8\x88\x80\x80\x80",
                                                   "Gr\xC3\xB6\xC3\x9F"
                                                   "e",
                                                   "\xE9\x87\x91",
                                                   "e\xCC\x81",
                                                   "\xCC\x81",
                                                   "\xF0\x9F\x98\x80",
                                                   "\xF0\x9F\x91\xA9\xE2\x80\x8D\xF0\x9F\x92\xBB",
                                                   std::string(5000, 'x'),
                                                   std::string(40000, '"'),
                                                   std::string(17000, '\x01')};
    return texts;
}

Object filled(Object const &schema, Filling const &filling) {
    if (as<MetaBool>(schema) != nullptr) {
        return MetaBool::New(filling.truth);
    }
    if (as<MetaInt>(schema) != nullptr) {
        return MetaInt::New(filling.number);
    }
    if (auto const list = as<MetaList>(schema)) {
        auto const made = MetaList::New(list->GetType(), list->GetElementSchema());
        Object const element = list->GetElementSchema();
        made->Append(element != nullptr ? filled(element, filling) : MetaString::New(filling.text));
        return made;
    }
    if (auto const structure = as<MetaStruct>(schema)) {
        auto const made = MetaStruct::New(structure->GetName());
        for (std::string const &field : structure->GetFieldNames()) {
            setField(*made, field, filled(structure->GetField(field), filling));
        }
        return made;
    }
    return MetaString::New(filling.text);
}

Object unset(Object const &schema) {
    if (auto const list = as<MetaList>(schema)) {
        auto const made = MetaList::New(list->GetType(), list->GetElementSchema());
        if (as<MetaStruct>(list->GetElementSchema()) != nullptr) {
            made->Append(MetaStruct::New(as<MetaStruct>(list->GetElementSchema())->GetName()));
        }
        return made;
    }
    return schema; // a schema is a value that is not set
}

Object random(std::mt19937 &generator, unsigned depth) {
    switch (below(generator, depth > 0 ? 9 : 5)) {
    case 0:
        return MetaBool::New(below(generator, 2) == 1);
    case 1:
        return MetaInt::New(static_cast<int64_t>(uint64_t{generator()} << 32 | generator()));
    case 2:
        return MetaString::New();
    case 3:
    case 4:
        return MetaString::New(randomText(generator));
    case 5:
    case 6: {
        bool const structures = below(generator, 2) == 1;
        auto const list = MetaList::New(structures ? StructList : StringList);
        for (unsigned left = below(generator, 4); left > 0; --left) {
            list->Append(random(generator, depth - 1));
        }
        return list;
    }
    default: {
        auto const structure = MetaStruct::New(randomText(generator));
        for (unsigned left = below(generator, 5); left > 0; --left) {
            setField(*structure, randomText(generator), random(generator, depth - 1));
        }
        return structure;
    }
    }
}

} // namespace FormatCases
