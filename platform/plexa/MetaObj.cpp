// SPDX-License-Identifier: Apache-2.0
#include "plexa/MetaObj.h"

#include <cstring>
#include <limits>
#include <stdexcept>
#include <typeinfo>
#include <utility>

#include <boost/make_shared.hpp>

#include "RowStore.h"

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
    made->Assign(value);
    return made;
}

MetaString::MetaString(MetaString const &other)
    : MetaObject(other) {
    *this = other;
}

MetaString::MetaString(MetaString &&other) noexcept
    : MetaObject(other)
    , text_(std::exchange(other.text_, ""))
    , size_(std::exchange(other.size_, 0))
    , set_(std::exchange(other.set_, false))
    , ownsText_(std::exchange(other.ownsText_, false)) {}

MetaString &MetaString::operator=(MetaString const &other) {
    if (this != &other) {
        Assign(other.ViewValue());
        set_ = other.set_;
    }
    return *this;
}

MetaString::~MetaString() {
    if (ownsText_) {
        delete[] text_;
    }
}

void MetaString::Assign(std::string_view value) {
    if (value.size() > std::numeric_limits<uint32_t>::max()) {
        throw std::length_error("MetaString");
    }
    char *const copy = value.empty() ? nullptr : new char[value.size()];
    if (ownsText_) {
        delete[] text_;
    }
    if (copy != nullptr) {
        std::memcpy(copy, value.data(), value.size());
    }
    text_ = copy != nullptr ? copy : "";
    size_ = static_cast<uint32_t>(value.size());
    ownsText_ = copy != nullptr;
    set_ = true;
}

bool MetaString::IsSet() const {
    return set_;
}

std::string MetaString::GetValue() const {
    return std::string(ViewValue());
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
    if (MetaObject *const value = element.get(); value != nullptr && typeid(*value) == typeid(MetaStruct)) {
        if (rows_ == nullptr) {
            rows_ = boost::make_shared<RowStore>();
        }
        rows_->take(static_cast<MetaStruct &>(*value));
    }
}

std::vector<boost::shared_ptr<MetaObject>> MetaList::GetElements() const {
    return elements_;
}

std::vector<boost::shared_ptr<MetaObject>> const &MetaList::ViewElements() const {
    return elements_;
}

} // namespace Plexa::MetaObj
