// SPDX-License-Identifier: Apache-2.0
//
// Prints results in every format for check_formats.py to read: "case NAME", "value DUMP", "chosen NAMES" where the user
// chose fields, and for each format "format NAME machine|human BYTES" with the document behind it.
#include <cstdio>
#include <string>

#include "CaseValues.h"
#include "Declarations.h"
#include "Dump.h"
#include "doubles/LumoDouble.h"
#include "plexa/Formatter.h"

namespace {

using namespace FormatCases;
using namespace Plexa;
using namespace Plexa::MetaObj;

constexpr char const *names[] = {"simple", "table", "tree", "json", "yaml", "xml", "csv", "keyvalue"};

void put(std::string const &text) {
    std::fwrite(text.data(), 1, text.size(), stdout);
}

void print(std::string const &name, Result const &result, FormatSettings const &settings = {}) {
    put("case " + name + "\nvalue " + dump(result.value.get(), result.schema.get()) + "\n");
    if (std::optional<std::vector<std::string>> const chosen = settings.chosenFields()) {
        put("chosen");
        for (std::string const &field : *chosen) {
            put(" " + hex(field));
        }
        put("\n");
    }
    for (char const *each : names) {
        Format const &format = requireFormat(each, "--format");
        StringSink sink;
        format.write(result, settings, sink);
        put("format " + std::string(each) + (format.isMachine ? " machine " : " human ") +
            std::to_string(sink.text().size()) + "\n" + sink.text() + "\n");
    }
}

void printCommand(PluginTest::Declaration const &declaration) {
    auto const command = declaration.make();
    Object const schema = command->GetOutputSpec()->GetOutputType();
    FormatSettings own;
    for (auto const &[key, value] : command->GetDefaultOutputFormatParameters()) {
        own.set(key, value);
    }
    std::string const name = "command " + declaration.className + " ";
    print(name + "plain", {filled(schema, {"Some text", 4096, true}), schema}, own);
    print(name + "least", {filled(schema, {"", INT64_MIN, false}), schema}, own);
    print(name + "most", {filled(schema, {"9", INT64_MAX, true}), schema}, own);
    print(name + "unset", {unset(schema), schema}, own);
    if (auto const list = boost::dynamic_pointer_cast<MetaList>(schema)) {
        print(name + "empty", {MetaList::New(list->GetType(), list->GetElementSchema()), schema}, own);
    }
    for (std::size_t i = 0; i < trickyTexts().size(); ++i) {
        print(name + "text " + std::to_string(i), {filled(schema, {trickyTexts()[i], 1, true}), schema}, own);
    }
    if (auto const structure = outermostStructure(schema)) {
        std::vector<std::string> const fields = structure->GetFieldNames();
        FormatSettings chosen = own;
        chosen.chooseFields(structure->GetName(), fields.back() + "," + fields.front(), fields);
        print(name + "chosen", {filled(schema, {"Some text", 7, false}), schema}, chosen);
    }
}

boost::shared_ptr<MetaList> listOf(MetaType type, std::vector<Object> const &elements) {
    auto const list = MetaList::New(type);
    for (Object const &each : elements) {
        list->Append(each);
    }
    return list;
}

void printShapes() {
    for (std::size_t i = 0; i < trickyTexts().size(); ++i) {
        std::string const &text = trickyTexts()[i];
        std::string const number = std::to_string(i);
        print("shape text " + number, {MetaString::New(text), MetaString::New()});
        print("shape list of texts " + number,
              {listOf(StringList, {MetaString::New(text), MetaString::New(text)}), nullptr});
        auto const named = MetaStruct::New(text);
        named->SetField(text, text);
        print("shape names " + number, {named, nullptr});
        print("shape names in a list " + number, {listOf(StructList, {named}), nullptr});
    }
    print("shape unset", {MetaString::New(), MetaString::New()});
    print("shape numbers", {listOf(Int, {MetaInt::New(INT64_MIN), MetaInt::New(INT64_MAX), MetaInt::New()}), nullptr});
    print("shape truths", {listOf(Bool, {MetaBool::New(true), MetaBool::New(false), MetaBool::New()}), nullptr});
    print("shape nothing in a list", {listOf(StructList, {Object(), MetaStruct::New("Empty"), Object()}), nullptr});
    print("shape empty structure", {MetaStruct::New("Empty"), nullptr});
    print("shape empty list", {listOf(StructList, {}), nullptr});
    print("shape lists in lists",
          {listOf(StringList, {listOf(StringList, {}), listOf(StringList, {MetaString::New("a"), listOf(Int, {})})}),
           nullptr});

    auto const first = MetaStruct::New("Row");
    first->SetField("a", 1);
    first->SetField("b", "x");
    auto const second = MetaStruct::New("Row");
    second->SetField("b", listOf(StructList, {first, first}));
    second->SetField("c", true);
    second->SetField("a", "text where a number was");
    print("shape rows of different layouts", {listOf(StructList, {first, second, first}), nullptr});

    auto const recursive = MetaStruct::New("Row");
    recursive->SetField("b", listOf(StructList, {second, listOf(StructList, {first})}));
    print("shape structures by one schema inside each other", {listOf(StructList, {recursive, first}), nullptr});

    Object deep = MetaString::New("bottom");
    for (int i = 0; i < 30; ++i) {
        auto const around = MetaStruct::New("Level");
        around->SetField("down", listOf(StructList, {deep}));
        deep = around;
    }
    print("shape deep", {deep, nullptr});
    auto const longName = MetaStruct::New("Long");
    longName->SetField(std::string(3000, 'k'), 1);
    longName->SetField(std::string(3000, 'm'), listOf(StructList, {first}));
    print("shape long names", {listOf(StructList, {longName}), nullptr});
}

} // namespace

int main() {
    Doubles::CallLog log;
    Doubles::LumoDouble const daemon(log); // classes that open a session when made are given one
    for (auto const &declarations : {PluginTest::providerDeclarations(), PluginTest::containerDeclarations(),
                                     PluginTest::daemonDeclarations(), PluginTest::groupDeclarations()}) {
        for (PluginTest::Declaration const &declaration : declarations) {
            printCommand(declaration);
        }
    }
    printShapes();
    for (unsigned seed = 0; seed < 1500; ++seed) {
        std::mt19937 generator(seed);
        print("random " + std::to_string(seed), {random(generator, 4), nullptr});
    }
    return std::fflush(stdout) == 0 ? 0 : 1;
}
