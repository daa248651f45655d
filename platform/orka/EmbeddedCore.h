// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <chrono>
#include <memory>
#include <string>
#include <utility>

#include <kj/async.h>
#include <kj/refcount.h>
#include <kj/timer.h>

#include "orka/ArrayFile.h"
#include "orka/Embedded.h"

namespace Orka {

/// What an embedded provider and its pending promises share: the open file, and how an operation is tried.
class EmbeddedProvider::Core final : public kj::Refcounted {
public:
    Core(std::string path, ProviderSurroundings const &surroundings);

    struct VersionedInventory {
        std::shared_ptr<std::vector<StorageArray> const> arrays;
        std::shared_ptr<std::vector<StorageContainer> const> containers;
        uint64_t version = 0;
    };
    /// Reads the file only when it has changed since the last call.
    VersionedInventory inventory(ArrayFile &file);

    /// Runs `work(ArrayFile &)` from the event loop, again and again while the file is locked.
    template <typename Work>
    auto run(kj::TimePoint deadline, Work work) -> kj::Promise<Outcome<decltype(work(std::declval<ArrayFile &>()))>> {
        return kj::evalLater([self = kj::addRef(*this), deadline, work = std::move(work)]() mutable {
            return self->begin(deadline, std::move(work));
        });
    }

private:
    static constexpr kj::Duration firstPause = 1 * kj::MILLISECONDS;
    static constexpr kj::Duration longestPause = 50 * kj::MILLISECONDS;

    template <typename Work>
    using ResultOf = Outcome<decltype(std::declval<Work &>()(std::declval<ArrayFile &>()))>;

    template <typename Work>
    kj::Promise<ResultOf<Work>> begin(kj::TimePoint deadline, Work work) {
        if (timer_.now() >= deadline) {
            return ResultOf<Work>(tooLate());
        }
        return attempt(deadline, firstPause, std::move(work));
    }

    template <typename Work>
    kj::Promise<ResultOf<Work>> attempt(kj::TimePoint deadline, kj::Duration pause, Work work) {
        auto result = tryOnce(work);
        if (result.ok() || result.failure().code() != Wire::ErrorCode::FileBusy) {
            return result;
        }
        auto const now = timer_.now();
        if (now >= deadline) {
            return ResultOf<Work>(stillLocked());
        }
        return timer_.atTime(std::min(deadline, now + pause))
            .then([self = kj::addRef(*this), deadline, pause, work = std::move(work)]() mutable {
                return self->attempt(deadline, std::min(2 * pause, longestPause), std::move(work));
            });
    }

    template <typename Work>
    ResultOf<Work> tryOnce(Work &work) {
        auto result = outcomeOf([&] { return work(openFile()); });
        if (!result.ok() && mustReopenAfter(result.failure().code())) {
            result = outcomeOf([&] { return work(openFile()); });
        }
        return result;
    }

    ArrayFile &openFile();
    /// Closes the file when a failure leaves doubt about it. @return whether it is worth trying again at once: it had
    /// been replaced between the look at its path and the work on it.
    bool mustReopenAfter(Wire::ErrorCode code);
    Wire::Failure tooLate() const;
    Wire::Failure stillLocked() const;

    std::string path_;
    kj::Timer &timer_;
    std::function<std::string()> newUuid_;
    std::unique_ptr<ArrayFile> file_;
    VersionedInventory inventory_;
    /// Of what inventory_ was read; nothing: it has to be read.
    std::optional<int64_t> inventoryDataVersion_;
};

} // namespace Orka
