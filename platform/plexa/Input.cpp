// SPDX-License-Identifier: Apache-2.0
#include "plexa/CallSpec.h"

#include <boost/make_shared.hpp>

namespace Plexa::CallSpec {

boost::shared_ptr<Input> Input::New() {
    return boost::make_shared<Input>();
}

Input::Input() = default;
Input::~Input() = default;

bool Input::HasParameter(std::string const &name) const {
    return values_.contains(name);
}

std::string Input::GetString(std::string const &name) const {
    Value const *value = Find(name, String);
    return value != nullptr ? value->text : std::string();
}

int64_t Input::GetInt(std::string const &name) const {
    Value const *value = Find(name, Int);
    return value != nullptr ? value->number : 0;
}

bool Input::GetBool(std::string const &name) const {
    Value const *value = Find(name, Bool);
    if (value == nullptr) {
        value = Find(name, Flag);
    }
    return value != nullptr && value->truth;
}

std::vector<std::string> Input::GetStringList(std::string const &name) const {
    Value const *value = Find(name, StringList);
    return value != nullptr ? value->texts : std::vector<std::string>();
}

std::vector<int64_t> Input::GetIntList(std::string const &name) const {
    Value const *value = Find(name, IntList);
    return value != nullptr ? value->numbers : std::vector<int64_t>();
}

std::vector<bool> Input::GetBoolList(std::string const &name) const {
    Value const *value = Find(name, BoolList);
    return value != nullptr ? value->truths : std::vector<bool>();
}

void Input::SetString(std::string const &name, std::string const &value) {
    Value stored;
    stored.type = String;
    stored.text = value;
    values_.insert_or_assign(name, std::move(stored));
}

void Input::SetInt(std::string const &name, int64_t value) {
    Value stored;
    stored.type = Int;
    stored.number = value;
    values_.insert_or_assign(name, std::move(stored));
}

void Input::SetBool(std::string const &name, bool value) {
    Value stored;
    stored.type = Bool;
    stored.truth = value;
    values_.insert_or_assign(name, std::move(stored));
}

void Input::SetFlag(std::string const &name) {
    Value stored;
    stored.type = Flag;
    stored.truth = true;
    values_.insert_or_assign(name, std::move(stored));
}

void Input::SetStringList(std::string const &name, std::vector<std::string> const &value) {
    Value stored;
    stored.type = StringList;
    stored.texts = value;
    values_.insert_or_assign(name, std::move(stored));
}

void Input::SetIntList(std::string const &name, std::vector<int64_t> const &value) {
    Value stored;
    stored.type = IntList;
    stored.numbers = value;
    values_.insert_or_assign(name, std::move(stored));
}

void Input::SetBoolList(std::string const &name, std::vector<bool> const &value) {
    Value stored;
    stored.type = BoolList;
    stored.truths = value;
    values_.insert_or_assign(name, std::move(stored));
}

Input::Value const *Input::Find(std::string const &name, ParameterType type) const {
    auto found = values_.find(name);
    return found != values_.end() && found->second.type == type ? &found->second : nullptr;
}

} // namespace Plexa::CallSpec
