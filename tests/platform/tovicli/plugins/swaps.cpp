// SPDX-License-Identifier: Apache-2.0
//
// Puts another file in the place of its neighbour while it is being loaded: TEST_SWAP_NEW becomes TEST_SWAP_OLD.
#include <cstdio>
#include <cstdlib>

#include "plexa/AutoCli.h"

namespace {

[[gnu::constructor]] void swapNeighbours() {
    char const *const from = std::getenv("TEST_SWAP_NEW");
    char const *const to = std::getenv("TEST_SWAP_OLD");
    if (from == nullptr || to == nullptr || std::rename(from, to) != 0) {
        std::abort();
    }
}

} // namespace

void AutoCli_RegisterNamespaces(boost::shared_ptr<Plexa::AutoCli::Namespace> &) {}
