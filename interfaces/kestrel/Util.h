// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "kestrel/Lib.h"

namespace Kestrel::Util {

/// Joins the elements with the separator between neighbours; no elements give an empty text.
KESTREL_EXPORT std::string VectorToString(std::vector<std::string> const &elements, std::string const &separator);

} // namespace Kestrel::Util
