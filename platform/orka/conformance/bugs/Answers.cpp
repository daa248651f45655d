// SPDX-License-Identifier: Apache-2.0
//
// Bugs in what is told of one volume, and in when it is told.
#include <algorithm>
#include <map>

#include <kj/debug.h>

#include "conformance/bugs/Forwarding.h"

namespace Orka::Conformance {

namespace {

/// Keeps what it once read.
class StaleFacts final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> queryVirtualVolume(CallContext context, std::string containerId, std::string uuid) override {
        auto const known = known_->find(uuid);
        if (known != known_->end() && known->second.containerId == containerId) {
            return Outcome<VirtualVolume>(known->second);
        }
        return changed(Forwarding::queryVirtualVolume(std::move(context), std::move(containerId), std::move(uuid)),
                       [all = known_](VirtualVolume &volume) { (*all)[volume.uuid] = volume; });
    }

private:
    /// Shared with the promises, which may outlive this object.
    std::shared_ptr<std::map<std::string, VirtualVolume>> known_ =
        std::make_shared<std::map<std::string, VirtualVolume>>();
};

/// Finds names without regard to case.
class FoldsCase final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<std::optional<VirtualVolume>> queryVirtualVolumeByDirectoryName(CallContext context, std::string containerId,
                                                                           std::string directoryName) override {
        return Forwarding::queryVirtualVolumesOfContainer(context, containerId, INT64_MAX)
            .then([inner = share(), context, containerId, directoryName](
                      Outcome<std::vector<ConfigVolume>> &&volumes) mutable -> Answer<std::optional<VirtualVolume>> {
                if (volumes.ok()) {
                    for (auto const &volume : volumes.value()) {
                        directoryName = folded(volume.directoryName) == folded(directoryName) ? volume.directoryName
                                                                                              : directoryName;
                    }
                }
                return inner->provider->queryVirtualVolumeByDirectoryName(context, containerId, directoryName)
                    .attach(kj::mv(inner));
            });
    }

private:
    static std::string folded(std::string text) {
        std::transform(text.begin(), text.end(), text.begin(), [](char character) {
            return character >= 'A' && character <= 'Z' ? static_cast<char>(character | 0x20) : character;
        });
        return text;
    }
};

class StatsInBytes final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<SpaceStats> spaceStatsForVirtualVolume(CallContext context, std::string containerId,
                                                  std::string uuid) override {
        return changed(
            Forwarding::spaceStatsForVirtualVolume(std::move(context), std::move(containerId), std::move(uuid)),
            [](SpaceStats &stats) { stats.logicalMb *= int64_t{1} << 20; });
    }
};

/// Rounds down where it has to round up.
class ShortBitmap final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<UnsharedChunks> unsharedChunksVirtualVolume(CallContext context, std::string containerId,
                                                       std::string uuid) override {
        return changed(
            Forwarding::unsharedChunksVirtualVolume(std::move(context), std::move(containerId), std::move(uuid)),
            [](UnsharedChunks &chunks) {
                if (chunks.bitmap.size() % 2 != 0) {
                    chunks.bitmap.pop_back();
                }
            });
    }
};

class LosesMetadata final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Metadata> getMetadata(CallContext context, std::string containerId, std::string uuid) override {
        return changed(Forwarding::getMetadata(std::move(context), std::move(containerId), std::move(uuid)),
                       [](Metadata &pairs) { pairs.clear(); });
    }
};

/// Lets an exception out where a failure belongs.
class RejectsPromises final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> queryVirtualVolume(CallContext context, std::string containerId, std::string uuid) override {
        return otherwise(Forwarding::queryVirtualVolume(std::move(context), std::move(containerId), std::move(uuid)),
                         Wire::ErrorCode::NoSuchVolume, [](Wire::Failure const &failure) -> Answer<VirtualVolume> {
                             return KJ_EXCEPTION(FAILED, failure.sentence());
                         });
    }
};

/// Answers ten seconds after the last moment when there is little time.
class AnswersLate final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Listing<StorageArray>> queryStorageArray(CallContext context) override {
        if (context.deadline > timer().now() + 1 * kj::SECONDS) {
            return Forwarding::queryStorageArray(std::move(context));
        }
        auto const late = context.deadline + 10 * kj::SECONDS;
        context.deadline = late + 10 * kj::SECONDS;
        return timer().atTime(late).then([inner = share(), context]() mutable {
            return inner->provider->queryStorageArray(context).attach(kj::mv(inner));
        });
    }
};

/// Looks at the clock when the work is done.
class WorksAfterDeadline final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) override {
        if (context.deadline > timer().now()) {
            return Forwarding::createVirtualVolume(std::move(context), std::move(spec));
        }
        context.deadline = timer().now() + 10 * kj::SECONDS;
        return Forwarding::createVirtualVolume(std::move(context), std::move(spec))
            .then([](Outcome<VirtualVolume> &&) -> Outcome<VirtualVolume> {
                return Wire::Failure(Wire::ErrorCode::DeadlineExceeded, "the deadline has passed");
            });
    }
};

/// Says nothing of why.
class Speechless final : public Forwarding {
public:
    using Forwarding::Forwarding;
    Answer<Metadata> getMetadata(CallContext context, std::string containerId, std::string uuid) override {
        return otherwise(Forwarding::getMetadata(std::move(context), std::move(containerId), std::move(uuid)),
                         Wire::ErrorCode::NoSuchVolume, [](Wire::Failure const &failure) -> Answer<Metadata> {
                             return Outcome<Metadata>(Wire::Failure(failure.code(), ""));
                         });
    }
};

} // namespace

std::vector<Bug> answerBugs() {
    return {
        {"stale-facts", "A volume's facts are told as they were when they were first asked for.",
         "volume/query/follows-changes", put<StaleFacts>},
        {"folds-case", "A name is found in any case.", "volume/query-by-name/case", put<FoldsCase>},
        {"stats-in-bytes", "Space is told in bytes.", "volume/space-stats/agree-with-facts", put<StatsInBytes>},
        {"short-bitmap", "A bitmap's last byte is missing when it is an odd one.",
         "volume/unshared-chunks/bitmap-of-odd-sizes", put<ShortBitmap>},
        {"loses-metadata", "Metadata is always empty.", "volume/metadata/directory-name", put<LosesMetadata>},
        {"rejects-promises", "A volume that there is not rejects the promise.", "unknown-volume/query-volume",
         put<RejectsPromises>},
        {"speechless", "A failure has no sentence.", "unknown-volume/metadata", put<Speechless>,
         "the client says something itself"},
        {"answers-late", "What has little time is answered ten seconds late.", "deadline/short/query-arrays",
         put<AnswersLate>, "the client does not wait longer than its deadline"},
        {"works-after-deadline", "A volume is made although the deadline has passed.", "deadline/passed/create",
         put<WorksAfterDeadline>, "the client asks for nothing after its deadline"},
    };
}

} // namespace Orka::Conformance
