// SPDX-License-Identifier: Apache-2.0
//
// Registers half of what it has, then throws.
#include <stdexcept>

#include "plexa/AutoCli.h"

void AutoCli_RegisterNamespaces(boost::shared_ptr<Plexa::AutoCli::Namespace> &root) {
    root->GetNamespaceNode("storage")->RegisterNamespaceNode(Plexa::AutoCli::Namespace::New(), "half");
    throw std::runtime_error("no more\x1b");
}
