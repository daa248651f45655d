// SPDX-License-Identifier: Apache-2.0
#include "plexa/FormatSettings.h"

#include <algorithm>

#include <boost/algorithm/string/trim.hpp>

#include "ResultModel.h"
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
        text += (text.empty() ? "'" : ", '") + name + "'";
    }
    return text;
}

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

void FormatSettings::chooseFields(std::string const &structure, std::string const &names,
                                  std::vector<std::string> const &declared) {
    std::vector<std::string> const chosen = splitNames(names);
    if (chosen.empty()) {
        throw UsageError("--fields: no name given" +
                         (declared.empty() ? std::string() : "; there is " + joined(declared)));
    }
    for (std::string const &name : chosen) {
        if (std::find(declared.begin(), declared.end(), name) == declared.end()) {
            throw UsageError(declared.empty() ? "--fields: the result of this command has no fields"
                                              : "--fields: " + shownWord(name) +
                                                    " is no field of the result; there is " + joined(declared));
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
        text += scalarText(structure.GetField(pattern->substr(begin + 1, end - begin - 1)));
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
