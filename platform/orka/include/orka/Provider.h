// SPDX-License-Identifier: Apache-2.0
//
// What the daemon asks of a vendor provider, whichever way it reaches one: an array file opened in the process, or a
// server elsewhere. Values go in and out, nothing blocks, and every operation ends by its deadline.
//
// Who calls it: the daemon, from its event loop's thread. A method's name begins with the name of the operation that it
// performs (queryVirtualVolumesById performs queryVirtualVolume); fault rules and logs go by operation names.
//
// Promises: an operation's promise gives an Outcome, a value or a Wire::Failure with a finished sentence, and is
// rejected for nothing that a user should read. Arguments are taken by value, so that a caller may forget them. A
// promise that is dropped cancels what has not begun; a mutation may have taken place nevertheless. Promises may
// outlive the provider, but not the timer that it was made with.
//
// Failures to expect from every operation: NoSuchContainer where one is named, ProviderUnreachable (with where and
// why), ProviderBusy (the deadline came while the array was locked), DeadlineExceeded, File* for an array file that is
// not what it should be, InvalidArgument, InternalError. Those of a single operation are named with it. A provider that
// failed is asked again as it is: it recovers by itself.
//
// Idempotency: a mutation that carries a key takes effect once, however often it is repeated with the same key; each
// repetition that succeeds gives the first one's answer. What failed has had no effect and is tried anew. A key that
// comes back with another mutation is an InvalidArgument. Keys are remembered long enough for retries, not for ever.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <kj/async.h>
#include <kj/time.h>

#include "orka/Model.h"
#include "orka/Outcome.h"

namespace Orka {

/// What goes with every operation.
struct CallContext {
    kj::TimePoint deadline;                 ///< on the timer that the provider was made with
    std::optional<std::string> orkaContext; ///< on whose behalf the host speaks; nothing: nobody's
    std::string idempotencyKey;             ///< for mutations; empty: every call is a new one
};

/// A list that a provider keeps and hands out without copying. Two lists of one provider object with the same version
/// are the same, so a caller may keep what it made of one for as long as the version stays.
template <typename T>
struct Listing {
    std::shared_ptr<std::vector<T> const> items; ///< never null
    uint64_t version = 0;
};

class Provider {
public:
    virtual ~Provider() = default;

    template <typename T>
    using Answer = kj::Promise<Outcome<T>>;

    /// Every storage array with its endpoints.
    virtual Answer<Listing<StorageArray>> queryStorageArray(CallContext context) = 0;

    /// Every storage container. Its array ids name arrays of queryStorageArray with the same version.
    virtual Answer<Listing<StorageContainer>> queryStorageContainer(CallContext context) = 0;

    /// Makes a volume and answers with it whole. Failures: NoSuchContainer, AlreadyExists (the directory name),
    /// TooLarge (above the container's maximum), InvalidArgument (a negative size).
    virtual Answer<VirtualVolume> createVirtualVolume(CallContext context, VolumeSpec spec) = 0;

    /// Failures: NoSuchVolume, InUse (it is bound).
    virtual Answer<Done> deleteVirtualVolume(CallContext context, std::string containerId, std::string uuid) = 0;

    /// Binds a volume to an endpoint of one of its container's arrays. Bound to that endpoint already is success.
    /// Failures: NoSuchVolume, NoSuchEndpoint, NoAccessibleEndpoint (the array says that this one is not), InUse (bound
    /// to another endpoint).
    virtual Answer<Done> bindVirtualVolume(CallContext context, std::string containerId, std::string uuid,
                                           std::string endpointUid) = 0;

    /// Not bound is success. Failures: NoSuchVolume.
    virtual Answer<Done> unbindVirtualVolume(CallContext context, std::string containerId, std::string uuid) = 0;

    /// One volume with all its facts. Failures: NoSuchVolume.
    virtual Answer<VirtualVolume> queryVirtualVolume(CallContext context, std::string containerId,
                                                     std::string uuid) = 0;

    /// The first `max` config volumes of a container in the order of their making. Failures: NoSuchContainer.
    virtual Answer<std::vector<ConfigVolume>> queryVirtualVolumesOfContainer(CallContext context,
                                                                             std::string containerId, int64_t max) = 0;

    /// What is known of each id, in the order of the ids; an id may occur twice. Failures: NoSuchContainer.
    virtual Answer<std::vector<VolumePresence>> queryVirtualVolumesById(CallContext context, std::string containerId,
                                                                        std::vector<std::string> uuids) = 0;

    /// The config volume with a directory name, or nothing. Failures: NoSuchContainer.
    virtual Answer<std::optional<VirtualVolume>>
    queryVirtualVolumeByDirectoryName(CallContext context, std::string containerId, std::string directoryName) = 0;

    /// Every volume that is bound, of every container: what an unbind timer has to look after when the daemon starts.
    virtual Answer<std::vector<VirtualVolume>> queryVirtualVolumesBound(CallContext context) = 0;

    /// Failures: NoSuchVolume.
    virtual Answer<SpaceStats> spaceStatsForVirtualVolume(CallContext context, std::string containerId,
                                                          std::string uuid) = 0;

    /// Failures: NoSuchVolume.
    virtual Answer<UnsharedChunks> unsharedChunksVirtualVolume(CallContext context, std::string containerId,
                                                               std::string uuid) = 0;

    /// A volume's metadata in order. A config volume is made with one pair: its directory name under "directoryName".
    /// Failures: NoSuchVolume.
    virtual Answer<Metadata> getMetadata(CallContext context, std::string containerId, std::string uuid) = 0;

    /// Tells the provider on whose behalf the host speaks from now on: context.orkaContext, or nobody's.
    virtual Answer<Done> setContext(CallContext context) = 0;
};

} // namespace Orka
