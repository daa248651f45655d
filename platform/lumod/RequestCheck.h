// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "wire/lumod.capnp.h"

namespace Lumod {

/// Reads everything that a request says, by its schema. A message may be sound as a web of pointers and still lead to a
/// list of numbers where a text should be; a handler that met that half-way would have done half of its work.
/// @throws kj::Exception for a pointer to something else than the schema says, and for a text without an end
void readWhole(Wire::Request::Reader request);

} // namespace Lumod
