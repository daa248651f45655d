// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "Surveyor.h"

namespace Lumod {

/// A command may speak of a provider's array when the provider's record lists it or, listing none, when the provider
/// exports it.
/// @throws Wire::Failure NoSuchArray; the provider's own failure when it had to be asked and could not be
void requireArray(Survey const &survey, ProviderEntry const &provider, std::string const &arrayId);

} // namespace Lumod
