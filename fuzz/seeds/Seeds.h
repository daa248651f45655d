// SPDX-License-Identifier: Apache-2.0
//
// Inputs to begin with that are made when the targets are built: what the product itself would write, so that they are
// never older than the schema or the layout that they follow.
#pragma once

#include <functional>
#include <string>
#include <string_view>

namespace Fuzz {

/// Takes an input of the target in question, under a name of its own.
using Keep = std::function<void(std::string_view name, std::string_view bytes)>;

void makeDatabaseSeeds(Keep const &arrayFiles, Keep const &hostStores); ///< sound files
void makeMessageSeeds(Keep const &keep);                                ///< one message of each kind
void makeReplySeeds(Keep const &keep);                                  ///< a request's number and what answers it
void makeRequestSeeds(Keep const &keep);         ///< a socket's number and a request of each kind
void makeProviderAnswerSeeds(Keep const &keep);  ///< an operation's number and what a provider sends back
void makeProviderRequestSeeds(Keep const &keep); ///< a request for each operation

} // namespace Fuzz
