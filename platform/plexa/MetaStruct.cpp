// SPDX-License-Identifier: Apache-2.0
#include "plexa/MetaObj.h"

#include <utility>

#include <boost/make_shared.hpp>

namespace Plexa::MetaObj {

boost::shared_ptr<MetaStruct> MetaStruct::New(std::string const &name) {
    auto made = boost::make_shared<MetaStruct>();
    made->name_ = name;
    return made;
}

MetaStruct::~MetaStruct() = default;

void MetaStruct::SetField(std::string const &field, boost::shared_ptr<MetaBool> const &value) {
    Store(field, value);
}

void MetaStruct::SetField(std::string const &field, boost::shared_ptr<MetaInt> const &value) {
    Store(field, value);
}

void MetaStruct::SetField(std::string const &field, boost::shared_ptr<MetaList> const &value) {
    Store(field, value);
}

void MetaStruct::SetField(std::string const &field, boost::shared_ptr<MetaString> const &value) {
    Store(field, value);
}

void MetaStruct::SetField(std::string const &field, char const *value) {
    auto made = boost::make_shared<MetaString>();
    made->set_ = true;
    made->value_ = value == nullptr ? "" : value; // copied once: long lists are made of these
    Store(field, std::move(made));
}

void MetaStruct::SetField(std::string const &field, int64_t value) {
    Store(field, MetaInt::New(value));
}

void MetaStruct::SetField(std::string const &field, std::string const &value) {
    Store(field, MetaString::New(value));
}

void MetaStruct::SetField(std::string const &field, std::vector<std::string> const &value) {
    auto list = MetaList::New(StringList);
    for (std::string const &text : value) {
        list->Append(MetaString::New(text));
    }
    Store(field, std::move(list));
}

void MetaStruct::SetField(std::string const &field, bool value) {
    Store(field, MetaBool::New(value));
}

void MetaStruct::SetField(std::string const &field, int value) {
    Store(field, MetaInt::New(value));
}

std::string MetaStruct::GetName() const {
    return name_;
}

std::vector<std::string> MetaStruct::GetFieldNames() const {
    std::vector<std::string> names;
    names.reserve(fields_.size());
    for (Field const &field : fields_) {
        names.push_back(field.name);
    }
    return names;
}

boost::shared_ptr<MetaObject> MetaStruct::GetField(std::string const &field) const {
    for (Field const &candidate : fields_) {
        if (candidate.name == field) {
            return candidate.value;
        }
    }
    return {};
}

std::vector<MetaStruct::Field> const &MetaStruct::ViewFields() const {
    return fields_;
}

void MetaStruct::Store(std::string const &field, boost::shared_ptr<MetaObject> value) {
    for (Field &candidate : fields_) {
        if (candidate.name == field) {
            candidate.value = std::move(value);
            return;
        }
    }
    if (fields_.empty()) {
        fields_.reserve(2); // few structures have fewer; a long list then makes half as many allocations
    }
    fields_.push_back({field, std::move(value)});
}

} // namespace Plexa::MetaObj
