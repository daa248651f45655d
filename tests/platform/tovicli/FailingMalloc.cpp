// SPDX-License-Identifier: Apache-2.0
//
// Loaded before a program: its allocation of the number that TEST_FAIL_ALLOCATION tells finds no memory.
#include <cerrno>
#include <cstddef>
#include <cstdlib>

extern "C" void *__libc_malloc(std::size_t bytes);

namespace {

long left = -1; // not asked yet

bool isToFail() {
    if (left < 0) {
        char const *const number = std::getenv("TEST_FAIL_ALLOCATION");
        left = number != nullptr ? std::strtol(number, nullptr, 10) : 0;
    }
    return left > 0 && --left == 0;
}

} // namespace

extern "C" __attribute__((visibility("default"))) void *malloc(std::size_t bytes) {
    if (isToFail()) {
        errno = ENOMEM;
        return nullptr;
    }
    return __libc_malloc(bytes);
}
