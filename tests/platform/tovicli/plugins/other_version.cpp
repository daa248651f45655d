// SPDX-License-Identifier: Apache-2.0
//
// Built against version 2 of the framework.
extern "C" int plexa_two();

extern "C" __attribute__((visibility("default"))) int AutoCli_RegisterNamespaces() {
    return plexa_two();
}
