// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include <boost/shared_ptr.hpp>

#include "plexa/MetaObj.h"

namespace FormatCases {

/// A structure's field from a value whose kind is known only now; a kind that no field can have sets nothing.
inline void setField(Plexa::MetaObj::MetaStruct &structure, std::string const &field,
                     boost::shared_ptr<Plexa::MetaObj::MetaObject> const &value) {
    using Plexa::MetaObj::MetaBool;
    using Plexa::MetaObj::MetaInt;
    using Plexa::MetaObj::MetaList;
    using Plexa::MetaObj::MetaString;
    if (auto const list = boost::dynamic_pointer_cast<MetaList>(value)) {
        structure.SetField(field, list);
    } else if (auto const text = boost::dynamic_pointer_cast<MetaString>(value)) {
        structure.SetField(field, text);
    } else if (auto const number = boost::dynamic_pointer_cast<MetaInt>(value)) {
        structure.SetField(field, number);
    } else if (auto const truth = boost::dynamic_pointer_cast<MetaBool>(value)) {
        structure.SetField(field, truth);
    }
}

} // namespace FormatCases
