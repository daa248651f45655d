// SPDX-License-Identifier: Apache-2.0
//
// Registers "storage early", then needs a daemon session; registers "storage late" when offline.
#include <cstdlib>

#include "kestrel/Lib.h"
#include "plexa/AutoCli.h"

void AutoCli_RegisterNamespaces(boost::shared_ptr<Plexa::AutoCli::Namespace> &root) {
    auto const storage = root->GetNamespaceNode("storage");
    storage->SubNamespace("early");
    if (std::getenv("TOVI_OFFLINE") == nullptr || std::getenv("TEST_NEVER_A_SESSION") != nullptr) {
        throw Kestrel::Lib::KestrelException("Unable to initialize lumoLib", "here", 1, {});
    }
    storage->RegisterNamespaceNode(Plexa::AutoCli::Namespace::New(), "late");
}
