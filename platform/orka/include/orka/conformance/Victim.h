// SPDX-License-Identifier: Apache-2.0
//
// A process that is killed in the middle of a mutation, seen from its own side. The kit starts it with the words of one
// mutation; it says "begun" when it is about to ask, "answered" when it has been answered, one line each on standard
// output, and then lives until it is killed or its standard input ends.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include <kj/async-io.h>

#include "orka/Provider.h"

namespace Orka::Conformance {

/// Performs one mutation: KEY create CONTAINER NAME, KEY delete CONTAINER UUID, KEY bind CONTAINER UUID ENDPOINT, or
/// KEY unbind CONTAINER UUID.
/// @return the status that the process should end with: 0, or 1 when the mutation failed or the words make no sense
int actAsVictim(std::vector<std::string> const &words,
                std::function<std::unique_ptr<Provider>(kj::Timer &, kj::Network &)> const &connect);

} // namespace Orka::Conformance
