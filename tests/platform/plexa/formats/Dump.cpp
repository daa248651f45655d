// SPDX-License-Identifier: Apache-2.0
#include "Dump.h"

#include <algorithm>

namespace FormatCases {

using namespace Plexa::MetaObj;

namespace {

std::string dumpStruct(MetaStruct const &value, MetaStruct const *schema) {
    std::vector<std::string> names = schema != nullptr ? schema->GetFieldNames() : std::vector<std::string>();
    for (std::string const &name : value.GetFieldNames()) {
        if (std::find(names.begin(), names.end(), name) == names.end()) {
            names.push_back(name);
        }
    }
    std::string text = "M" + hex(value.GetName()) + ";" + std::to_string(names.size()) + ";";
    for (std::string const &name : names) {
        text += hex(name) + ";";
        text += dump(value.GetField(name).get(), schema != nullptr ? schema->GetField(name).get() : nullptr);
    }
    return text;
}

std::string dumpList(MetaList const &value, MetaList const *schema) {
    boost::shared_ptr<MetaObject> element = schema != nullptr ? schema->GetElementSchema() : nullptr;
    if (element == nullptr) {
        element = value.GetElementSchema();
    }
    std::string text = "L" + std::to_string(value.GetElements().size()) + ";";
    for (boost::shared_ptr<MetaObject> const &each : value.GetElements()) {
        text += dump(each.get(), element.get());
    }
    return text;
}

} // namespace

std::string hex(std::string const &bytes) {
    constexpr char const *digits = "0123456789abcdef";
    std::string text;
    for (char const c : bytes) {
        text += digits[static_cast<unsigned char>(c) >> 4];
        text += digits[static_cast<unsigned char>(c) & 0xF];
    }
    return text;
}

std::string dump(MetaObject const *value, MetaObject const *schema) {
    if (value == nullptr || !value->IsSet()) {
        return "N";
    }
    if (auto const *truth = dynamic_cast<MetaBool const *>(value)) {
        return truth->GetValue() ? "T" : "F";
    }
    if (auto const *number = dynamic_cast<MetaInt const *>(value)) {
        return "I" + std::to_string(number->GetValue()) + ";";
    }
    if (auto const *text = dynamic_cast<MetaString const *>(value)) {
        return "S" + hex(text->GetValue()) + ";";
    }
    if (auto const *list = dynamic_cast<MetaList const *>(value)) {
        return dumpList(*list, dynamic_cast<MetaList const *>(schema));
    }
    return dumpStruct(dynamic_cast<MetaStruct const &>(*value), dynamic_cast<MetaStruct const *>(schema));
}

} // namespace FormatCases
