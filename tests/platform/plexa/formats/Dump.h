// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "plexa/Formatter.h"

namespace FormatCases {

/// A value in a form that needs no escapes: N, T, F, I<digits>; S<hex>; L<count>; and the elements,
/// M<hex of the structure's name>;<count>; and for each field the hex of its name, a semicolon and its value. Fields
/// stand in declared order, unset ones too, then those that were not declared.
std::string dump(Plexa::MetaObj::MetaObject const *value, Plexa::MetaObj::MetaObject const *schema);

std::string hex(std::string const &bytes);

} // namespace FormatCases
