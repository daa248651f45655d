// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "Arena.h"
#include "Connection.h"
#include "lumolib/LumoLib.h"

namespace LumoClient {

/// Builds the records of a storage-container result from the replies of one answer.
///
/// The answer for a large site has 100,000 containers on a handful of arrays behind a provider or two, so whatever
/// equals what the container before it had is shared: the arrays' records always, the list of them and the provider's
/// URL when they repeat.
class StorageRecords {
public:
    StorageRecords(Arena &arena, Connection const &connection)
        : arena_(arena)
        , connection_(connection) {}

    /// @throw Wire::Failure ProtocolError for a reply that is of another kind or contradicts itself
    void take(Compact::Reply::Reader reply);
    /// Lays the table of all containers; call once, after the last reply.
    void finish(StorageContainerResult &result);

private:
    /// The containers of one reply, one after the other.
    struct Chunk {
        StorageContainerInfo *first;
        std::size_t count;
    };

    void takeArrays(Compact::List<Compact::StorageArray>::Reader arrays);
    void takeContainers(Compact::List<Compact::StorageContainer>::Reader containers);
    void fillArray(StorageArrayInfo &record, Compact::StorageArray::Reader array);
    void fillEndpoint(ProtocolEndpointInfo &record, Compact::Endpoint::Reader endpoint);
    void fillContainer(StorageContainerInfo &record, Compact::StorageContainer::Reader container);
    StorageArrayInfo **arraysOf(Compact::List<std::uint32_t>::Reader places);
    char const *providerUrl(std::string_view url);

    Arena &arena_;
    Connection const &connection_;
    std::vector<StorageArrayInfo *> table_;
    std::vector<Chunk> chunks_;
    StorageArrayInfo **lastArrays_ = nullptr;
    std::size_t lastArrayCount_ = 0;
    char const *lastUrl_ = "";
    std::size_t lastUrlLength_ = 0;
};

} // namespace LumoClient
