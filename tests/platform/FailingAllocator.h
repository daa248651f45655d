// SPDX-License-Identifier: Apache-2.0
//
// A test program that links this has an allocator that can be told to fail: whatever is tried can be tried with every
// allocation of it failing in turn. Only `new` of the thread that asked fails.
#pragma once

namespace FailingAllocator {

/// The n-th allocation of this thread from now fails, once, with std::bad_alloc. 0: none will.
void failIn(long n);

/// Whether the allocation that was to fail has not come yet.
bool isPending();

} // namespace FailingAllocator
