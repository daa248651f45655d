// SPDX-License-Identifier: Apache-2.0
#include "FailingAllocator.h"

#include <cstdlib>
#include <new>

namespace {

thread_local long countdown = 0;

void *allocateOrFail(std::size_t size) {
    if (countdown > 0 && --countdown == 0) {
        throw std::bad_alloc();
    }
    void *result = std::malloc(size > 0 ? size : 1);
    if (result == nullptr) {
        throw std::bad_alloc();
    }
    return result;
}

} // namespace

namespace FailingAllocator {

void failIn(long n) {
    countdown = n;
}

bool isPending() {
    return countdown > 0;
}

} // namespace FailingAllocator

void *operator new(std::size_t size) {
    return allocateOrFail(size);
}

void *operator new[](std::size_t size) {
    return allocateOrFail(size);
}

void operator delete(void *pointer) noexcept {
    std::free(pointer);
}

void operator delete[](void *pointer) noexcept {
    std::free(pointer);
}

void operator delete(void *pointer, std::size_t) noexcept {
    std::free(pointer);
}

void operator delete[](void *pointer, std::size_t) noexcept {
    std::free(pointer);
}
