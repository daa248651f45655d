// SPDX-License-Identifier: Apache-2.0
#include "plexa/OptionParser.h"

#include <algorithm>
#include <charconv>
#include <utility>

#include "plexa/Text.h"
#include "plexa/UsageError.h"

namespace Plexa {

namespace {

int64_t toNumber(std::string const &option, std::string const &value) {
    int64_t number = 0;
    char const *const end = value.data() + value.size();
    auto const [position, error] = std::from_chars(value.data(), end, number);
    if (error == std::errc::result_out_of_range && position == end) {
        throw UsageError(option + ": " + shownWord(value) +
                         " is out of range, a whole number from -9223372036854775808 to 9223372036854775807 is "
                         "expected");
    }
    if (error != std::errc() || position != end) {
        throw UsageError(option + ": " + shownWord(value) + " is not a number, a whole number is expected");
    }
    return number;
}

bool toTruth(std::string const &option, std::string const &value) {
    if (equalIgnoringCase(value, "true")) {
        return true;
    }
    if (equalIgnoringCase(value, "false")) {
        return false;
    }
    throw UsageError(option + ": " + shownWord(value) + " is not a boolean, true or false is expected");
}

bool isList(CallSpec::ParameterType type) {
    return type == CallSpec::StringList || type == CallSpec::IntList || type == CallSpec::BoolList;
}

char const *expectation(CallSpec::ParameterType type) {
    switch (type) {
    case CallSpec::Int:
    case CallSpec::IntList:
        return "a whole number";
    case CallSpec::Bool:
    case CallSpec::BoolList:
        return "true or false";
    default:
        return "a text";
    }
}

} // namespace

OptionParser::OptionParser(std::vector<Group> groups) {
    for (Group const &group : groups) {
        for (auto const &parameter : group.spec->GetParameters()) {
            Target target;
            target.parameter = parameter;
            target.input = group.input;
            targets_.push_back(std::move(target));
        }
    }
}

void OptionParser::alsoSuggest(OptionParser const &other) {
    for (Target const &target : other.targets_) {
        otherNames_.push_back(target.parameter->GetName());
    }
}

bool OptionParser::looksLikeOption(std::string const &word) {
    return word.size() > 1 && word[0] == '-';
}

bool OptionParser::knows(std::string const &word) const {
    return find(std::string_view(word).substr(0, word.find('='))) != nullptr;
}

void OptionParser::take(std::vector<std::string> const &words, std::size_t &position) {
    std::string const &word = words[position];
    bool const isLong = word.starts_with("--");
    std::size_t const equals = isLong ? word.find('=') : std::string::npos;
    std::string const option = word.substr(0, equals);
    Target *const target = find(option);
    if (target == nullptr) {
        failUnknown(option);
    }
    CallSpec::ParameterType const type = target->parameter->GetType();
    std::string const name = "--" + target->parameter->GetName();
    if (target->given && !isList(type)) {
        throw UsageError(name + " is given twice");
    }
    target->given = true;
    ++position;
    if (equals != std::string::npos) {
        std::string const value = word.substr(equals + 1);
        if (type == CallSpec::Flag) {
            throw UsageError(name + " takes no value, " + shownWord(value) + " was given");
        }
        target->store(name, value);
    } else if (type == CallSpec::Flag) {
        target->input->SetFlag(target->parameter->GetName());
    } else if (position < words.size()) {
        target->store(name, words[position]);
        ++position;
    } else {
        throw UsageError(name + " needs a value, " + expectation(type) + " is expected");
    }
}

void OptionParser::Target::store(std::string const &option, std::string const &value) {
    std::string const name = parameter->GetName();
    switch (parameter->GetType()) {
    case CallSpec::String:
        input->SetString(name, value);
        break;
    case CallSpec::Int:
        input->SetInt(name, toNumber(option, value));
        break;
    case CallSpec::Bool:
        input->SetBool(name, toTruth(option, value));
        break;
    case CallSpec::StringList:
        texts.push_back(value);
        break;
    case CallSpec::IntList:
        numbers.push_back(toNumber(option, value));
        break;
    case CallSpec::BoolList:
        truths.push_back(toTruth(option, value));
        break;
    case CallSpec::Flag:
        break; // takes no value
    }
}

void OptionParser::finish() {
    for (Target &target : targets_) {
        std::string const name = target.parameter->GetName();
        CallSpec::ParameterType const type = target.parameter->GetType();
        if (!target.given) {
            continue;
        }
        if (type == CallSpec::StringList) {
            target.input->SetStringList(name, target.texts);
        } else if (type == CallSpec::IntList) {
            target.input->SetIntList(name, target.numbers);
        } else if (type == CallSpec::BoolList) {
            target.input->SetBoolList(name, target.truths);
        }
    }
}

void OptionParser::requireAll(Group const &group) {
    std::string missing;
    std::size_t count = 0;
    for (auto const &parameter : group.spec->GetParameters()) {
        if (parameter->IsRequired() && !group.input->HasParameter(parameter->GetName())) {
            missing += (count == 0 ? "--" : ", --") + parameter->GetName();
            ++count;
        }
    }
    if (count > 0) {
        throw UsageError((count == 1 ? "missing required parameter: " : "missing required parameters: ") + missing);
    }
}

OptionParser::Target const *OptionParser::find(std::string_view option) const {
    if (!option.starts_with('-')) {
        return nullptr; // a value or a part of the path, an empty one perhaps
    }
    bool const isLong = option.starts_with("--");
    std::string_view const name = option.substr(isLong ? 2 : 1);
    for (Target const &target : targets_) {
        if (!name.empty() && name == (isLong ? target.parameter->GetName() : target.parameter->GetAlias())) {
            return &target;
        }
    }
    return nullptr;
}

OptionParser::Target *OptionParser::find(std::string_view option) {
    return const_cast<Target *>(std::as_const(*this).find(option));
}

void OptionParser::failUnknown(std::string const &option) const {
    std::vector<std::string> names;
    for (Target const &target : targets_) {
        names.push_back(target.parameter->GetName());
    }
    names.insert(names.end(), otherNames_.begin(), otherNames_.end());
    std::string const bare = option.substr(std::min(option.find_first_not_of('-'), option.size()));
    std::vector<std::string> near = nearNames(bare, names);
    for (std::string &name : near) {
        name.insert(0, "--");
    }
    throw UsageError("unknown option " + shownWord(option) + didYouMean(near));
}

} // namespace Plexa
