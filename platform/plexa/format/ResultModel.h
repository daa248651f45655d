// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include <boost/shared_ptr.hpp>

#include "plexa/MetaObj.h"

namespace Plexa {

using Object = boost::shared_ptr<MetaObj::MetaObject>;

enum class Kind { Nothing, Scalar, Number, ScalarList, StructList, Struct };

/// What a value is, or, where there is no value, what its schema declares.
Kind kindOf(Object const &value, Object const &schema);

/// False for a value that is absent or a scalar that was never set.
bool isSet(Object const &value);

/// A scalar's text as it came: not escaped, without unit. Empty for a value that is not set or no scalar.
std::string scalarText(Object const &value);

/// The schema of a list's elements: what the list was made with, else what the list's own schema declares.
Object elementSchema(Object const &list, Object const &schema);

/// A field of a structure with what it is declared as; either may be empty.
struct FieldView {
    std::string name;
    Object value;
    Object schema;
};

/// The fields of a structure: the declared ones in declared order, then what the value holds beyond them.
std::vector<FieldView> fieldsOf(Object const &value, Object const &schema);

/// The named ones of the fields, in the order of the names; names that are no field's are passed over.
std::vector<FieldView> selected(std::vector<FieldView> const &fields, std::vector<std::string> const &names);

/// The name of a structure, or of the schema in its place.
std::string structureName(Object const &value, Object const &schema);

} // namespace Plexa
