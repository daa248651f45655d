// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <type_traits>

#include "wire/compact/Builder.h"
#include "wire/compact/ListReader.h"

namespace Wire::Compact {

/// A list of structures.
template <typename Element>
struct List {
    using Reader = StructListReader<Element>;
    using Builder = StructListBuilder<Element>;
};

template <>
struct List<Text> {
    using Reader = TextListReader;
    using Builder = TextListBuilder;
};

template <typename Number>
requires std::is_arithmetic_v<Number>
struct List<Number> {
    using Reader = NumberListReader<Number>;
    using Builder = NumberListBuilder<Number>;
};

} // namespace Wire::Compact
