// SPDX-License-Identifier: Apache-2.0
#include <boost/pointer_cast.hpp>

#include "doubles/RecordingCall.h"

using namespace Plexa::MetaObj;

namespace Doubles {
namespace {

using ObjectPtr = boost::shared_ptr<MetaObject>;

/// A set scalar as text.
std::string scalar(ObjectPtr const &value) {
    if (auto const truth = boost::dynamic_pointer_cast<MetaBool>(value)) {
        return truth->GetValue() ? "true" : "false";
    }
    if (auto const number = boost::dynamic_pointer_cast<MetaInt>(value)) {
        return std::to_string(number->GetValue());
    }
    if (auto const text = boost::dynamic_pointer_cast<MetaString>(value)) {
        return quoted(text->GetValue());
    }
    return "a value of another type";
}

std::string scalarType(ObjectPtr const &value) {
    return boost::dynamic_pointer_cast<MetaBool>(value)     ? "bool"
           : boost::dynamic_pointer_cast<MetaInt>(value)    ? "int"
           : boost::dynamic_pointer_cast<MetaString>(value) ? "string"
                                                            : "another type";
}

std::string fields(MetaStruct const &structure, std::string (*print)(ObjectPtr const &)) {
    std::string result = structure.GetName() + "{";
    char const *separator = "";
    for (std::string const &name : structure.GetFieldNames()) {
        result += separator + name + ": " + print(structure.GetField(name));
        separator = ", ";
    }
    return result + "}";
}

} // namespace

std::string render(ObjectPtr const &value) {
    if (!value) {
        return "none";
    }
    if (auto const structure = boost::dynamic_pointer_cast<MetaStruct>(value)) {
        return fields(*structure, render);
    }
    if (auto const list = boost::dynamic_pointer_cast<MetaList>(value)) {
        std::string result = "[";
        char const *separator = "";
        for (ObjectPtr const &element : list->GetElements()) {
            result += separator + render(element);
            separator = ", ";
        }
        return result + "]";
    }
    return value->IsSet() ? scalar(value) : "unset";
}

std::string describe(ObjectPtr const &schema) {
    if (!schema) {
        return "none";
    }
    if (auto const structure = boost::dynamic_pointer_cast<MetaStruct>(schema)) {
        return fields(*structure, describe);
    }
    if (auto const list = boost::dynamic_pointer_cast<MetaList>(schema)) {
        std::string const elements = list->GetType() == StringList   ? "strings"
                                     : list->GetType() == StructList ? describe(list->GetElementSchema())
                                                                     : "another type";
        return "list of " + elements + (list->GetElements().empty() ? "" : " with elements");
    }
    return scalarType(schema) + (schema->IsSet() ? " holding " + scalar(schema) : "");
}

} // namespace Doubles
