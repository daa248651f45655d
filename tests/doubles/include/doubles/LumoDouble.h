// SPDX-License-Identifier: Apache-2.0
//
// Stands in for liblumo: linked in its place, it defines every function of lumolib/LumoLib.h. A test makes one
// LumoDouble, says what the daemon answers, runs a command, and reads the log. While a LumoDouble lives it serves every
// LumoLib call of the process; without one such a call ends the process.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "doubles/Answers.h"
#include "doubles/CallLog.h"
#include "doubles/LumoRecords.h"
#include "lumolib/LumoLib.h"

namespace Doubles {

/// The answer of a request that hands out a record. The record may be given on failure too, and null on success.
template <class Record>
struct Reply {
    int32_t code = 0;
    Record *record = nullptr;
};

struct ContainerReply {
    int32_t code = 0;
    std::string text;
    StorageContainerResult *record = nullptr;
};

/// The unshared chunks are made with malloc for every call, since the caller releases them with free().
struct ChunksReply {
    int32_t code = 0;
    int64_t blockSize = 0;
};

/// How many results of each kind were handed out and not released yet.
struct Unreleased {
    int storageContainers = 0;
    int queries = 0;
    int spaceStats = 0;
    int infos = 0;
    int metadata = 0;
    int total() const {
        return storageContainers + queries + spaceStats + infos + metadata;
    }
};

class LumoDouble {
public:
    explicit LumoDouble(CallLog &callLog);
    ~LumoDouble();
    LumoDouble(LumoDouble const &) = delete;
    LumoDouble &operator=(LumoDouble const &) = delete;

    /// The one that serves the process's calls.
    static LumoDouble &current();

    CallLog &log;
    LumoRecords records;

    Answers<bool> init{true};
    /// Not set: a null pointer.
    Answers<Text> err2String{Text("the daemon's reason")};
    Answers<ContainerReply> getStorageContainer{ContainerReply{0, "", records.containers({})}};
    /// The canonical id; not set: the id is refused.
    Answers<Text> normalizeContainerId{Text("0c0a0b0c-0000-4000-8000-00000000c1d0")};
    Answers<Reply<LumoQueryResult>> queryAllConfigLumos{{0, records.query({})}};
    Answers<int32_t> activateProvider{0};
    Answers<int32_t> deactivateProvider{0};
    Answers<int32_t> injectFault{0};
    Answers<bool> setFaultInjectionEnabled{true};
    Answers<bool> addRule{true};
    Answers<bool> modifyRule{true};
    Answers<int32_t> debugCommand{0};
    Answers<int32_t> setSpaceEfficiency{0};
    Answers<Reply<LumoSpaceStats>> spaceStats{{0, records.spaceStats(0, 0, 0, 0)}};
    Answers<Reply<LumoInfo>> lumoInfo{{0, records.info(Text())}};
    Answers<ChunksReply> unsharedChunks;
    Answers<Reply<LumoMetadata>> metadata{{0, records.metadata({})}};

    /// The entries of the last fault that was injected: the caller's memory.
    LumoArrayFault *faultEntries = nullptr;
    /// Successful opens less closes.
    int openSessions = 0;
    Unreleased unreleased;
};

} // namespace Doubles
