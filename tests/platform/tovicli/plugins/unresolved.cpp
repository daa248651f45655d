// SPDX-License-Identifier: Apache-2.0
//
// Calls what no library has.
#include "plexa/AutoCli.h"

extern "C" void Test_NobodyHasThis();
extern "C" void Test_NorThis();

void AutoCli_RegisterNamespaces(boost::shared_ptr<Plexa::AutoCli::Namespace> &) {
    Test_NobodyHasThis();
    Test_NorThis();
}
