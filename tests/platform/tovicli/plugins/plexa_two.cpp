// SPDX-License-Identifier: Apache-2.0
extern "C" __attribute__((visibility("default"))) int plexa_two() {
    return 2;
}
