// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "Surveyor.h"

namespace Lumod {

/// A command may speak of a provider's array when the provider's record lists it or, listing none, when the provider
/// exports it.
/// @throws Wire::Failure NoSuchArray; the provider's own failure when it had to be asked and could not be
void requireArray(Survey const &survey, ProviderEntry const &provider, std::string const &arrayId);

/// Who is active for an array by records and commands, whether he can be reached now or not; empty when nobody is. (A
/// view's array tells who serves it, which is the next one while the active one cannot be reached.)
ProviderPtr activeFor(Survey const &survey, ProviderSet const &providers, std::string const &arrayId);

} // namespace Lumod
