// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "Directory.h"

namespace Kestrel {

/// Removes `name` in `parent` with everything below it; links are removed, not followed. However deep the tree is,
/// three descriptors and no recursion are enough: a directory inside a directory is first moved up. What is missing
/// already is no error, so that a removal that was cut off can be repeated. Throws Wire::Failure.
void removeTree(Directory const &parent, std::string const &name);

} // namespace Kestrel
