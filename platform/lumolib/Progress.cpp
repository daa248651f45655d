// SPDX-License-Identifier: Apache-2.0
#include "lumolib/Progress.h"

#include <atomic>

namespace {

// One thread counts; a signal handler, or another thread, reads. What it reads may be a moment old, never torn.
std::atomic<std::uint64_t> done{0};
std::atomic<std::uint64_t> total{0};
static_assert(std::atomic<std::uint64_t>::is_always_lock_free, "a signal handler reads these");

} // namespace

bool LumoPlatform_Progress(uint64_t *doneNow, uint64_t *totalNow) {
    std::uint64_t const all = total.load(std::memory_order_relaxed);
    std::uint64_t const some = done.load(std::memory_order_relaxed);
    if (doneNow == nullptr || totalNow == nullptr || (all == 0 && some == 0)) {
        return false;
    }
    *doneNow = some;
    // More than was expected: whoever announced the total did not know.
    *totalNow = some > all ? 0 : all;
    return true;
}

void LumoPlatform_NoteProgress(uint64_t doneNow, uint64_t totalNow) {
    done.store(doneNow, std::memory_order_relaxed);
    total.store(totalNow, std::memory_order_relaxed);
}

void LumoPlatform_NoteOneDone(void) {
    if (total.load(std::memory_order_relaxed) != 0) {
        done.fetch_add(1, std::memory_order_relaxed);
    }
}

void LumoPlatform_NoteNotNeeded(uint64_t count) {
    std::uint64_t const all = total.load(std::memory_order_relaxed);
    if (count < all) {
        total.store(all - count, std::memory_order_relaxed);
    }
}
