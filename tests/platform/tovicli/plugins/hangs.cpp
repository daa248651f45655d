// SPDX-License-Identifier: Apache-2.0
//
// Never comes back from its entry point.
#include <unistd.h>

#include "plexa/AutoCli.h"

void AutoCli_RegisterNamespaces(boost::shared_ptr<Plexa::AutoCli::Namespace> &) {
    for (;;) {
        pause();
    }
}
