// SPDX-License-Identifier: Apache-2.0
#include "plexa/MetaObj.h"

#include <boost/make_shared.hpp>

namespace Plexa::MetaObj {

MetaObject::~MetaObject() = default;

bool MetaObject::IsSet() const {
    return true;
}

boost::shared_ptr<MetaBool> MetaBool::New() {
    return boost::make_shared<MetaBool>();
}

boost::shared_ptr<MetaBool> MetaBool::New(bool value) {
    auto made = boost::make_shared<MetaBool>();
    made->set_ = true;
    made->value_ = value;
    return made;
}

MetaBool::~MetaBool() = default;

bool MetaBool::IsSet() const {
    return set_;
}

bool MetaBool::GetValue() const {
    return value_;
}

boost::shared_ptr<MetaInt> MetaInt::New() {
    return boost::make_shared<MetaInt>();
}

boost::shared_ptr<MetaInt> MetaInt::New(int64_t value) {
    auto made = boost::make_shared<MetaInt>();
    made->set_ = true;
    made->value_ = value;
    return made;
}

MetaInt::~MetaInt() = default;

bool MetaInt::IsSet() const {
    return set_;
}

int64_t MetaInt::GetValue() const {
    return value_;
}

boost::shared_ptr<MetaString> MetaString::New() {
    return boost::make_shared<MetaString>();
}

boost::shared_ptr<MetaString> MetaString::New(std::string const &value) {
    auto made = boost::make_shared<MetaString>();
    made->set_ = true;
    made->value_ = value;
    return made;
}

MetaString::~MetaString() = default;

bool MetaString::IsSet() const {
    return set_;
}

std::string MetaString::GetValue() const {
    return value_;
}

std::string const &MetaString::ViewValue() const {
    return value_;
}

boost::shared_ptr<MetaList> MetaList::New(MetaType type) {
    return New(type, boost::shared_ptr<MetaObject>());
}

boost::shared_ptr<MetaList> MetaList::New(MetaType type, boost::shared_ptr<MetaObject> const &elementSchema) {
    auto made = boost::make_shared<MetaList>();
    made->type_ = type;
    made->elementSchema_ = elementSchema;
    return made;
}

MetaList::~MetaList() = default;

MetaType MetaList::GetType() const {
    return type_;
}

boost::shared_ptr<MetaObject> MetaList::GetElementSchema() const {
    return elementSchema_;
}

void MetaList::Append(boost::shared_ptr<MetaObject> const &element) {
    elements_.push_back(element);
}

std::vector<boost::shared_ptr<MetaObject>> MetaList::GetElements() const {
    return elements_;
}

std::vector<boost::shared_ptr<MetaObject>> const &MetaList::ViewElements() const {
    return elements_;
}

} // namespace Plexa::MetaObj
