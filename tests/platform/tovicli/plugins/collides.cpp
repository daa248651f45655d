// SPDX-License-Identifier: Apache-2.0
//
// Wants a name that another plug-in, earlier in sorted order, has taken.
#include "plexa/AutoCli.h"

void AutoCli_RegisterNamespaces(boost::shared_ptr<Plexa::AutoCli::Namespace> &root) {
    auto const storage = root->GetNamespaceNode("storage");
    storage->RegisterNamespaceNode(Plexa::AutoCli::Namespace::New(), "unshared");
    auto const mine = Plexa::AutoCli::Namespace::New();
    mine->SetDescription("from collides");
    storage->RegisterNamespaceNode(mine, "sample");
}
