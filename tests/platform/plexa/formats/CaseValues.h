// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <random>
#include <string>
#include <vector>

#include "plexa/MetaObj.h"

namespace FormatCases {

using Object = boost::shared_ptr<Plexa::MetaObj::MetaObject>;

/// Texts that some format, or a reader of it, takes for something else.
std::vector<std::string> const &trickyTexts();

/// What the scalars of a value are filled with.
struct Filling {
    std::string text;
    int64_t number = 0;
    bool truth = false;
};

/// A value as the schema declares it, with one element in each list.
Object filled(Object const &schema, Filling const &filling);

/// A value as the schema declares it whose scalars are not set and whose lists are empty.
Object unset(Object const &schema);

/// A value of any shape. Equal for equal states of the generator.
Object random(std::mt19937 &generator, unsigned depth);

} // namespace FormatCases
