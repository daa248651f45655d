// SPDX-License-Identifier: Apache-2.0
//
// A shared library that is no plug-in.
extern "C" __attribute__((visibility("default"))) int not_an_entry_point() {
    return 1;
}
