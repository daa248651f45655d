// SPDX-License-Identifier: Apache-2.0
#include "doubles/LumoDouble.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>

using Doubles::LumoDouble;
using Doubles::Text;
using Doubles::Verbatim;

namespace Doubles {
namespace {
LumoDouble *serving = nullptr;
}

LumoDouble::LumoDouble(CallLog &callLog)
    : log(callLog) {
    serving = this;
}

LumoDouble::~LumoDouble() {
    serving = nullptr;
}

LumoDouble &LumoDouble::current() {
    if (serving == nullptr) {
        std::fputs("a LumoLib function was called while no LumoDouble lives\n", stderr);
        std::abort();
    }
    return *serving;
}

namespace {

LumoDouble &lumo() {
    return LumoDouble::current();
}

/// How a caller's result pointer stood when the call came in.
template <class Record>
Verbatim out(Record *const *pointer) {
    return {pointer == nullptr ? "null" : *pointer == nullptr ? "&null" : "&stale"};
}

Verbatim number(int32_t const *pointer) {
    return {pointer == nullptr ? "null" : "&" + std::to_string(*pointer)};
}

Verbatim record(void const *pointer) {
    return {pointer == nullptr ? "null" : "result"};
}

Verbatim block64(void const *block) {
    auto const *const bytes = static_cast<unsigned char const *>(block);
    bool const zero = std::all_of(bytes, bytes + 64, [](unsigned char byte) { return byte == 0; });
    return {zero ? "64 zero bytes" : "64 bytes, not all zero"};
}

Verbatim faults(int32_t count, LumoArrayFault const *entries) {
    std::string result = "[";
    for (int32_t i = 0; i < count; ++i) {
        result +=
            (i == 0 ? "" : ", ") + quoted(entries[i].arrayId) + (entries[i].isActive != 0 ? " active" : " passive");
    }
    return {result + "]"};
}

template <class Record>
int32_t handOut(Reply<Record> const &reply, Record **result, int &unreleased) {
    if (reply.record != nullptr) {
        *result = reply.record;
        ++unreleased;
    }
    return reply.code;
}

void takeBack(char const *function, void const *pointer, int &unreleased) {
    lumo().log.call(function, record(pointer));
    if (pointer != nullptr) {
        --unreleased;
    }
}

} // namespace
} // namespace Doubles

using namespace Doubles;

bool LumoLib_Init(int first, int second) {
    lumo().log.call("LumoLib_Init", first, second);
    bool const opened = lumo().init.next();
    lumo().openSessions += opened ? 1 : 0;
    return opened;
}

void LumoLib_Exit(void) {
    lumo().log.call("LumoLib_Exit");
    --lumo().openSessions;
}

char const *LumoLib_Err2String(int32_t code) {
    lumo().log.call("LumoLib_Err2String", code);
    return lumo().records.text(lumo().err2String.next());
}

LumoErrorEx LumoLib_GetStorageContainer(int32_t first, void const *second, StorageContainerResult **result) {
    lumo().log.call("LumoLib_GetStorageContainer", first, record(second), out(result));
    ContainerReply const reply = lumo().getStorageContainer.next();
    handOut(Reply<StorageContainerResult>{reply.code, reply.record}, result, lumo().unreleased.storageContainers);
    LumoErrorEx error = {};
    error.code = reply.code;
    reply.text.copy(error.text, sizeof error.text - 1);
    return error;
}

bool LumoLib_ErrorExIsSuccess(LumoErrorEx const *error) {
    lumo().log.call("LumoLib_ErrorExIsSuccess", Verbatim{"error"});
    return error->code == 0;
}

char const *LumoLib_ErrorExStr(LumoErrorEx const *error) {
    lumo().log.call("LumoLib_ErrorExStr", Verbatim{"error"});
    return error->text;
}

void LumoLib_FreeStorageContainerResult(StorageContainerResult *result) {
    takeBack("LumoLib_FreeStorageContainerResult", result, lumo().unreleased.storageContainers);
}

bool LumoLib_NormalizeContainerIdString(char const *text, char *buffer37) {
    lumo().log.call("LumoLib_NormalizeContainerIdString", text);
    Text const canonical = lumo().normalizeContainerId.next();
    if (canonical) {
        std::strncpy(buffer37, canonical->c_str(), 36);
        buffer37[36] = '\0';
    }
    return canonical.has_value();
}

int32_t LumoLib_QueryAllConfigLumos(char const *containerId, int32_t max, int32_t third, LumoQueryResult **result,
                                    int32_t fifth) {
    lumo().log.call("LumoLib_QueryAllConfigLumos", containerId, max, third, out(result), fifth);
    return handOut(lumo().queryAllConfigLumos.next(), result, lumo().unreleased.queries);
}

void LumoLib_FreeQueryResult(LumoQueryResult *result) {
    takeBack("LumoLib_FreeQueryResult", result, lumo().unreleased.queries);
}

int32_t LumoLib_ActivateProvider(char const *arrayId, char const *vpName, char const *activeVpUrl, void *block) {
    lumo().log.call("LumoLib_ActivateProvider", arrayId, vpName, activeVpUrl, block64(block));
    std::memset(block, 0xA5, 64); // the block is the callee's to fill; nobody may read it afterwards
    return lumo().activateProvider.next();
}

int32_t LumoLib_DeactivateProvider(char const *arrayId, char const *vpName) {
    lumo().log.call("LumoLib_DeactivateProvider", arrayId, vpName);
    return lumo().deactivateProvider.next();
}

int32_t LumoLib_VendorProviderInjectFault(char const *vpName, char const *vpUrl, char const *status, int32_t count,
                                          LumoArrayFault *entries) {
    lumo().log.call("LumoLib_VendorProviderInjectFault", vpName, vpUrl, status, count, faults(count, entries));
    lumo().faultEntries = entries;
    return lumo().injectFault.next();
}

bool LumoLib_SetFaultInjectionEnabled(bool enabled) {
    lumo().log.call("LumoLib_SetFaultInjectionEnabled", enabled);
    return lumo().setFaultInjectionEnabled.next();
}

bool LumoLib_AddFaultInjectionRule(char const *fault, char const *operation, int32_t frequency, int32_t timeMs) {
    lumo().log.call("LumoLib_AddFaultInjectionRule", fault, operation, frequency, timeMs);
    return lumo().addRule.next();
}

bool LumoLib_ModifyFaultInjectionRule(char const *fault, char const *operation, int32_t frequency, int32_t timeMs) {
    lumo().log.call("LumoLib_ModifyFaultInjectionRule", fault, operation, frequency, timeMs);
    return lumo().modifyRule.next();
}

int32_t LumoLib_DebugCommand(int32_t const *logLevel, int32_t const *dump, int32_t const *unbindPeriodUs) {
    lumo().log.call("LumoLib_DebugCommand", number(logLevel), number(dump), number(unbindPeriodUs));
    return lumo().debugCommand.next();
}

int32_t LumoLib_SetSPMSpaceEfficiencyManipulationEnabled(uint8_t enabled) {
    lumo().log.call("LumoLib_SetSPMSpaceEfficiencyManipulationEnabled", enabled);
    return lumo().setSpaceEfficiency.next();
}

int32_t LumoLib_SpaceStatsForLumo(char const *containerId, char const *uuid, LumoSpaceStats **stats) {
    lumo().log.call("LumoLib_SpaceStatsForLumo", containerId, uuid, out(stats));
    return handOut(lumo().spaceStats.next(), stats, lumo().unreleased.spaceStats);
}

void LumoLib_FreeLumoSpaceStatsInfo(LumoSpaceStats *stats) {
    takeBack("LumoLib_FreeLumoSpaceStatsInfo", stats, lumo().unreleased.spaceStats);
}

int32_t LumoLib_GetLumoInfo(char const *containerId, char const *uuid, LumoInfo **info) {
    lumo().log.call("LumoLib_GetLumoInfo", containerId, uuid, out(info));
    return handOut(lumo().lumoInfo.next(), info, lumo().unreleased.infos);
}

void LumoLib_FreeLumoInfo(LumoInfo *info) {
    takeBack("LumoLib_FreeLumoInfo", info, lumo().unreleased.infos);
}

int32_t LumoLib_UnsharedChunksLumo(char const *containerId, char const *uuid, int first, int second, int third,
                                   int fourth, int fifth, LumoUnsharedChunks **chunks) {
    lumo().log.call("LumoLib_UnsharedChunksLumo", containerId, uuid, first, second, third, fourth, fifth, out(chunks));
    ChunksReply const reply = lumo().unsharedChunks.next();
    if (reply.code == 0) {
        *chunks = static_cast<LumoUnsharedChunks *>(std::malloc(sizeof(LumoUnsharedChunks)));
        **chunks = {reply.blockSize, 0};
    }
    return reply.code;
}

int32_t LumoLib_GetLumoMetadata(char const *containerId, char const *uuid, LumoMetadata **metadata) {
    lumo().log.call("LumoLib_GetLumoMetadata", containerId, uuid, out(metadata));
    return handOut(lumo().metadata.next(), metadata, lumo().unreleased.metadata);
}

void LumoLib_FreeLumoMetadata(LumoMetadata *metadata) {
    takeBack("LumoLib_FreeLumoMetadata", metadata, lumo().unreleased.metadata);
}
