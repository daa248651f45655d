// SPDX-License-Identifier: Apache-2.0
#include "plexa/CallSpec.h"

#include <boost/make_shared.hpp>

namespace Plexa::CallSpec {

boost::shared_ptr<ParameterSpec> ParameterSpec::New(std::string const &name, ParameterType type) {
    return boost::shared_ptr<ParameterSpec>(new ParameterSpec(name, type));
}

ParameterSpec::ParameterSpec(std::string const &name, ParameterType type)
    : name_(name)
    , type_(type) {}

ParameterSpec::~ParameterSpec() = default;

void ParameterSpec::SetAlias(std::string const &alias) {
    alias_ = alias;
}

void ParameterSpec::SetDescription(std::string const &description) {
    description_ = description;
}

void ParameterSpec::SetRequired(bool required) {
    required_ = required;
}

std::string ParameterSpec::GetName() const {
    return name_;
}

ParameterType ParameterSpec::GetType() const {
    return type_;
}

std::string ParameterSpec::GetAlias() const {
    return alias_;
}

std::string ParameterSpec::GetDescription() const {
    return description_;
}

bool ParameterSpec::IsRequired() const {
    return required_;
}

boost::shared_ptr<InputSpec> InputSpec::New() {
    return boost::make_shared<InputSpec>();
}

void InputSpec::AddParameter(boost::shared_ptr<ParameterSpec> const &parameter) {
    parameters_.push_back(parameter);
}

std::vector<boost::shared_ptr<ParameterSpec>> InputSpec::GetParameters() const {
    return parameters_;
}

boost::shared_ptr<OutputSpec> OutputSpec::New() {
    return boost::make_shared<OutputSpec>();
}

void OutputSpec::SetOutputType(boost::shared_ptr<MetaObj::MetaObject> const &type) {
    type_ = type;
}

boost::shared_ptr<MetaObj::MetaObject> OutputSpec::GetOutputType() const {
    return type_;
}

boost::shared_ptr<Output> Output::New() {
    return boost::make_shared<Output>();
}

Output::Output() = default;
Output::~Output() = default;

void Output::SetMessage(std::string const &text) {
    message_ = text;
    hasMessage_ = true;
}

void Output::SetResult(boost::shared_ptr<MetaObj::MetaObject> const &result) {
    result_ = result;
}

void Output::Complete() {
    complete_ = true;
}

bool Output::HasMessage() const {
    return hasMessage_;
}

std::string Output::GetMessage() const {
    return message_;
}

boost::shared_ptr<MetaObj::MetaObject> Output::GetResult() const {
    return result_;
}

bool Output::IsComplete() const {
    return complete_;
}

} // namespace Plexa::CallSpec
