// SPDX-License-Identifier: Apache-2.0
#include "plexa/FormatSettings.h"

#include <algorithm>
#include <map>

#include <boost/algorithm/string/trim.hpp>

#include "ResultModel.h"
#include "plexa/Formatter.h"
#include "plexa/UsageError.h"

namespace Plexa {

namespace {

std::vector<std::string> splitNames(std::string const &names) {
    std::vector<std::string> split;
    std::size_t begin = 0;
    while (begin <= names.size()) {
        std::size_t const end = std::min(names.find(',', begin), names.size());
        std::string name = names.substr(begin, end - begin);
        boost::algorithm::trim(name, std::locale::classic());
        if (!name.empty()) {
            split.push_back(name);
        }
        begin = end + 1;
    }
    return split;
}

std::string joined(std::vector<std::string> const &names) {
    std::string text;
    for (std::string const &name : names) {
        text += (text.empty() ? "" : ", ") + shownWord(name);
    }
    return text;
}

/// Every structure that a schema declares, by name.
using Structures = std::map<std::string, std::vector<std::string>>;

void gather(Object const &schema, Structures &structures, std::size_t depth = 0) {
    constexpr std::size_t deepest = 64;
    if (depth > deepest) {
        return;
    }
    if (auto const list = boost::dynamic_pointer_cast<MetaObj::MetaList>(schema)) {
        gather(list->GetElementSchema(), structures, depth + 1);
    } else if (auto const structure = boost::dynamic_pointer_cast<MetaObj::MetaStruct>(schema)) {
        structures.emplace(structure->GetName(), structure->GetFieldNames());
        for (std::string const &field : structure->GetFieldNames()) {
            gather(structure->GetField(field), structures, depth + 1);
        }
    }
}

/// The names between percent signs.
std::vector<std::string> namesInPattern(std::string const &pattern) {
    std::vector<std::string> names;
    std::size_t begin = pattern.find('%');
    while (begin != std::string::npos) {
        std::size_t const end = pattern.find('%', begin + 1);
        if (end == std::string::npos) {
            break;
        }
        names.push_back(pattern.substr(begin + 1, end - begin - 1));
        begin = pattern.find('%', end + 1);
    }
    return names;
}

/// @throws UsageError for a name that is none of those that are declared
void requireName(std::string const &name, std::vector<std::string> const &declared, std::string const &option,
                 std::string const &what) {
    if (std::find(declared.begin(), declared.end(), name) == declared.end()) {
        throw UsageError(option + ": " + shownWord(name) + " is no " + what + didYouMean(nearNames(name, declared)) +
                         "; there is " + joined(declared));
    }
}

constexpr char const *noFields = ": the result of this command has no fields";

} // namespace

void FormatSettings::set(std::string const &key, std::string const &value) {
    for (auto &pair : pairs_) {
        if (pair.first == key) {
            pair.second = value;
            return;
        }
    }
    pairs_.emplace_back(key, value);
}

void FormatSettings::setFromUser(std::string const &assignment) {
    std::size_t const equals = assignment.find('=');
    std::string const key = assignment.substr(0, equals);
    bool const named = (key.starts_with("fields:") && key.size() > 7) || (key.starts_with("header:") && key.size() > 7);
    bool const unit = key.starts_with("units:") && key.find('.') != std::string::npos;
    if (equals == std::string::npos || !(named || unit || key == "table-columns")) {
        throw UsageError("--format-param: " + shownWord(assignment) +
                         " is none of fields:<structure>=..., header:<structure>=..., table-columns=..., "
                         "units:<structure>.<field>=...");
    }
    set(key, assignment.substr(equals + 1));
}

void FormatSettings::setFromUser(std::string const &assignment, Object const &schema) {
    setFromUser(assignment);
    Structures structures;
    gather(schema, structures);
    if (structures.empty()) {
        throw UsageError(std::string("--format-param") + noFields);
    }
    std::size_t const equals = assignment.find('=');
    std::string const key = assignment.substr(0, equals);
    std::string const value = assignment.substr(equals + 1);
    std::string structure;
    std::vector<std::string> fields;
    if (key == "table-columns") {
        auto const outermost = outermostStructure(schema);
        structure = outermost != nullptr ? outermost->GetName() : structures.begin()->first;
        fields = splitNames(value);
    } else {
        std::string const rest = key.substr(key.find(':') + 1);
        bool const isUnit = key.starts_with("units:");
        structure = isUnit ? rest.substr(0, rest.find('.')) : rest;
        fields = isUnit                       ? std::vector<std::string>{rest.substr(rest.find('.') + 1)}
                 : key.starts_with("fields:") ? splitNames(value)
                                              : namesInPattern(value);
    }
    std::vector<std::string> names;
    for (auto const &each : structures) {
        names.push_back(each.first);
    }
    requireName(structure, names, "--format-param", "structure of the result");
    for (std::string const &field : fields) {
        requireName(field, structures[structure], "--format-param", "field of " + shownWord(structure));
    }
}

void FormatSettings::chooseFields(std::string const &structure, std::string const &names,
                                  std::vector<std::string> const &declared) {
    std::vector<std::string> const chosen = splitNames(names);
    if (chosen.empty()) {
        throw UsageError("--fields: no name given" +
                         (declared.empty() ? std::string() : "; there is " + joined(declared)));
    }
    if (declared.empty()) {
        throw UsageError(std::string("--fields") + noFields);
    }
    for (auto name = chosen.begin(); name != chosen.end(); ++name) {
        requireName(*name, declared, "--fields", "field of the result");
        if (std::find(chosen.begin(), name, *name) != name) {
            throw UsageError("--fields: " + shownWord(*name) + " is named twice");
        }
    }
    chosen_ = chosen;
    set("fields:" + structure, names);
    set("table-columns", names);
}

std::optional<std::vector<std::string>> FormatSettings::fields(std::string const &structure) const {
    std::string const *names = find("fields:" + structure);
    return names != nullptr ? std::optional(splitNames(*names)) : std::nullopt;
}

std::optional<std::vector<std::string>> FormatSettings::tableColumns() const {
    std::string const *names = find("table-columns");
    return names != nullptr ? std::optional(splitNames(*names)) : std::nullopt;
}

std::optional<std::vector<std::string>> FormatSettings::chosenFields() const {
    return chosen_;
}

std::string FormatSettings::header(MetaObj::MetaStruct const &structure) const {
    std::string const *pattern = find("header:" + structure.GetName());
    if (pattern == nullptr) {
        return {};
    }
    std::string text;
    std::size_t position = 0;
    while (position < pattern->size()) {
        std::size_t const begin = std::min(pattern->find('%', position), pattern->size());
        std::size_t const end = begin < pattern->size() ? pattern->find('%', begin + 1) : std::string::npos;
        if (end == std::string::npos) {
            break;
        }
        text += pattern->substr(position, begin - position);
        text += scalarText(findValue(structure.ViewFields(), pattern->substr(begin + 1, end - begin - 1)));
        position = end + 1;
    }
    return text + pattern->substr(position);
}

std::string FormatSettings::unit(std::string const &structure, std::string const &field) const {
    std::string const *unit = find("units:" + structure + "." + field);
    return unit != nullptr ? *unit : std::string();
}

std::string const *FormatSettings::find(std::string const &key) const {
    for (auto const &pair : pairs_) {
        if (pair.first == key) {
            return &pair.second;
        }
    }
    return nullptr;
}

} // namespace Plexa
