/* SPDX-License-Identifier: Apache-2.0
 *
 * The client library of the Lumo daemon, in plain C.
 *
 * A program opens a session with LumoLib_Init, asks, and closes it with LumoLib_Exit. Codes are int32_t and 0 is
 * success. What a call hands out through its last argument belongs to the library until the caller releases it, whole,
 * with the matching free function; on failure nothing is handed out. Texts are NUL-terminated and live as long as what
 * holds them. Every free function takes null. A daemon that goes away between two calls is an error code, never a
 * signal; the next request connects again. No C++ exception leaves the library. One thread at a time.
 */
#ifndef LUMOLIB_LUMOLIB_H
#define LUMOLIB_LUMOLIB_H

#include <stdbool.h>
#include <stddef.h>
#include <stdint.h>

#define LUMOLIB_EXPORT __attribute__((visibility("default")))

#ifdef __cplusplus
extern "C" {
#endif

/** An error with its text. Returned by value, nothing to free; read it through its two functions only. */
typedef struct LumoErrorEx {
    int32_t code;
    char text[252];
} LumoErrorEx;

typedef enum EndpointTransportType {
    EndpointTransportScsi = 0,
    EndpointTransportNfs = 1,
    EndpointTransportNfs4x = 2
} EndpointTransportType;

/** How an endpoint is reached. SCSI: text1 is the lunID. NFS: text1 the ipAddress, text2 the serverMount.
 *  NFS4x: text1 the serverMount. Texts that do not apply are null. */
typedef struct EndpointTransportInfo {
    int32_t type;
    char const *text1;
    char const *text2;
} EndpointTransportInfo;

/** One protocol endpoint of an array as this host sees it. localUID may be null. */
typedef struct ProtocolEndpointInfo {
    char const *localUID;
    uint32_t reserved1[2];
    char const **nfs4xAddresses;
    int32_t nfs4xAddressCount;
    uint32_t reserved2[2];
    EndpointTransportInfo *transport;
    uint8_t isAccessible;
    uint8_t isConfigured;
} ProtocolEndpointInfo;

typedef struct StorageArrayInfo {
    char const *arrayId;
    char const *name;
    char const *vendorId;
    char const *modelId;
    int32_t endpointCount;
    ProtocolEndpointInfo **endpoints;
} StorageArrayInfo;

/** One storage container. maxLumoSizeMb is the size of the largest volume that fits, in MB. */
typedef struct StorageContainerInfo {
    char const *name;
    char const *providerUrl;
    char const *id;
    int32_t arrayCount;
    int64_t maxLumoSizeMb;
    uint32_t reserved;
    StorageArrayInfo **arrays;
} StorageContainerInfo;

/** Released whole with LumoLib_FreeStorageContainerResult. Containers may share array records. */
typedef struct StorageContainerResult {
    uint32_t containerCount;
    StorageContainerInfo **containers;
} StorageContainerResult;

/** One config volume: its id (uuid) and its directory name. */
typedef struct LumoQueryEntry {
    char const *id;
    char const *directoryName;
} LumoQueryEntry;

/** count pointers follow inline. Released with LumoLib_FreeQueryResult. */
typedef struct LumoQueryResult {
    int32_t count;
    LumoQueryEntry *entries[1];
} LumoQueryResult;

/** Made by the caller with malloc; stays the caller's. reserved is not read. */
typedef struct LumoArrayFault {
    char const *arrayId;
    uint8_t isActive;
    void *reserved;
} LumoArrayFault;

/** Sizes of one volume in MB. unsharedSize counts only when unsharedSizeValid is not 0. */
typedef struct LumoSpaceStats {
    uint32_t reserved;
    int64_t logicalSize;
    int64_t committedSize;
    int64_t unsharedSize;
    uint8_t unsharedSizeValid;
} LumoSpaceStats;

/** storageProfile is null for a volume without one. */
typedef struct LumoInfo {
    uint32_t reserved1;
    uint32_t reserved2;
    char const *storageProfile;
} LumoInfo;

/** Released with free(). blockSize in bytes; the chunk bitmap of chunkCount bits follows in whole bytes. */
typedef struct LumoUnsharedChunks {
    int64_t blockSize;
    int64_t chunkCount;
} LumoUnsharedChunks;

typedef struct LumoMetadataEntry {
    char const *key;
    char const *value;
    struct LumoMetadataEntry *next;
} LumoMetadataEntry;

/** A singly linked list; first is null when there are no pairs. Released with LumoLib_FreeLumoMetadata. */
typedef struct LumoMetadata {
    LumoMetadataEntry *first;
} LumoMetadata;

/** Opens a session; nested opens are counted. Both arguments are 0.
 *  @return false when no daemon answers. With TOVI_OFFLINE set the session opens without one, and every request then
 *  fails with the code for a daemon that is not running. */
LUMOLIB_EXPORT bool LumoLib_Init(int, int);
/** Closes one open; past zero it does nothing. */
LUMOLIB_EXPORT void LumoLib_Exit(void);

/** @return static text of the library, null for an unknown code. */
LUMOLIB_EXPORT char const *LumoLib_Err2String(int32_t code);
LUMOLIB_EXPORT bool LumoLib_ErrorExIsSuccess(LumoErrorEx const *error);
/** @return text inside the argument; lives as long as that does. */
LUMOLIB_EXPORT char const *LumoLib_ErrorExStr(LumoErrorEx const *error);

/** All storage containers that the registered providers export: (1, null, &result). */
LUMOLIB_EXPORT LumoErrorEx LumoLib_GetStorageContainer(int32_t, void const *, StorageContainerResult **result);
LUMOLIB_EXPORT void LumoLib_FreeStorageContainerResult(StorageContainerResult *result);

/** Writes the canonical form of a container id, 36 characters and the terminator, into the buffer of 37 bytes.
 *  @return false for a text that is no container id; the buffer is then an empty text. Needs no session. */
LUMOLIB_EXPORT bool LumoLib_NormalizeContainerIdString(char const *text, char *buffer37);

/** The config volumes of a container, at most max of them. The unnamed arguments are 0. */
LUMOLIB_EXPORT int32_t LumoLib_QueryAllConfigLumos(char const *containerId, int32_t max, int32_t,
                                                   LumoQueryResult **result, int32_t);
LUMOLIB_EXPORT void LumoLib_FreeQueryResult(LumoQueryResult *result);

/** Makes the provider the active one for the array. block64 points to 64 zeroed bytes of the caller's; reserved. */
LUMOLIB_EXPORT int32_t LumoLib_ActivateProvider(char const *arrayId, char const *vpName, char const *activeVpUrl,
                                                void *block64);
LUMOLIB_EXPORT int32_t LumoLib_DeactivateProvider(char const *arrayId, char const *vpName);
/** Makes the daemon act as if the provider's status, or its arrays' active flags, had changed. */
LUMOLIB_EXPORT int32_t LumoLib_VendorProviderInjectFault(char const *vpName, char const *vpUrl, char const *status,
                                                         int32_t count, LumoArrayFault *entries);

/** The fault-rule requests return true when done. A rule of frequency -1 and time -1 (in ms) is a removal. */
LUMOLIB_EXPORT bool LumoLib_SetFaultInjectionEnabled(bool enabled);
LUMOLIB_EXPORT bool LumoLib_AddFaultInjectionRule(char const *fault, char const *operation, int32_t frequency,
                                                  int32_t timeMs);
LUMOLIB_EXPORT bool LumoLib_ModifyFaultInjectionRule(char const *fault, char const *operation, int32_t frequency,
                                                     int32_t timeMs);

/** A null pointer leaves its setting as it is. The unbind period is in microseconds; 0 unbinds now. */
LUMOLIB_EXPORT int32_t LumoLib_DebugCommand(int32_t const *logLevel, int32_t const *dump,
                                            int32_t const *unbindPeriodUs);
LUMOLIB_EXPORT int32_t LumoLib_SetSPMSpaceEfficiencyManipulationEnabled(uint8_t enabled);

LUMOLIB_EXPORT int32_t LumoLib_SpaceStatsForLumo(char const *containerId, char const *uuid, LumoSpaceStats **stats);
LUMOLIB_EXPORT void LumoLib_FreeLumoSpaceStatsInfo(LumoSpaceStats *stats);
LUMOLIB_EXPORT int32_t LumoLib_GetLumoInfo(char const *containerId, char const *uuid, LumoInfo **info);
LUMOLIB_EXPORT void LumoLib_FreeLumoInfo(LumoInfo *info);
/** The five numbers are 0: the whole volume. The answer is released with free(). */
LUMOLIB_EXPORT int32_t LumoLib_UnsharedChunksLumo(char const *containerId, char const *uuid, int, int, int, int, int,
                                                  LumoUnsharedChunks **chunks);
LUMOLIB_EXPORT int32_t LumoLib_GetLumoMetadata(char const *containerId, char const *uuid, LumoMetadata **metadata);
LUMOLIB_EXPORT void LumoLib_FreeLumoMetadata(LumoMetadata *metadata);

#ifdef __cplusplus
}
#define LUMOLIB_ASSERT(condition) static_assert(condition, #condition)
#else
#define LUMOLIB_ASSERT(condition) _Static_assert(condition, #condition)
#endif

/* Array makers' 32-bit tools read these records directly: every offset and size is part of the interface. */
#if UINTPTR_MAX == 0xFFFFFFFFu
LUMOLIB_ASSERT(sizeof(LumoErrorEx) == 256);
LUMOLIB_ASSERT(sizeof(EndpointTransportInfo) == 12 && offsetof(EndpointTransportInfo, text1) == 4 &&
               offsetof(EndpointTransportInfo, text2) == 8);
LUMOLIB_ASSERT(sizeof(ProtocolEndpointInfo) == 36 && offsetof(ProtocolEndpointInfo, localUID) == 0 &&
               offsetof(ProtocolEndpointInfo, reserved1) == 4 && offsetof(ProtocolEndpointInfo, nfs4xAddresses) == 12);
LUMOLIB_ASSERT(offsetof(ProtocolEndpointInfo, nfs4xAddressCount) == 16 &&
               offsetof(ProtocolEndpointInfo, reserved2) == 20 && offsetof(ProtocolEndpointInfo, transport) == 28 &&
               offsetof(ProtocolEndpointInfo, isAccessible) == 32 &&
               offsetof(ProtocolEndpointInfo, isConfigured) == 33);
LUMOLIB_ASSERT(sizeof(StorageArrayInfo) == 24 && offsetof(StorageArrayInfo, arrayId) == 0 &&
               offsetof(StorageArrayInfo, name) == 4 && offsetof(StorageArrayInfo, vendorId) == 8 &&
               offsetof(StorageArrayInfo, modelId) == 12 && offsetof(StorageArrayInfo, endpointCount) == 16 &&
               offsetof(StorageArrayInfo, endpoints) == 20);
LUMOLIB_ASSERT(sizeof(StorageContainerInfo) == 32 && offsetof(StorageContainerInfo, name) == 0 &&
               offsetof(StorageContainerInfo, providerUrl) == 4 && offsetof(StorageContainerInfo, id) == 8 &&
               offsetof(StorageContainerInfo, arrayCount) == 12 &&
               offsetof(StorageContainerInfo, maxLumoSizeMb) == 16 && offsetof(StorageContainerInfo, reserved) == 24 &&
               offsetof(StorageContainerInfo, arrays) == 28);
LUMOLIB_ASSERT(sizeof(StorageContainerResult) == 8 && offsetof(StorageContainerResult, containers) == 4);
LUMOLIB_ASSERT(sizeof(LumoQueryEntry) == 8 && sizeof(LumoQueryResult) == 8 && offsetof(LumoQueryResult, entries) == 4);
LUMOLIB_ASSERT(sizeof(LumoArrayFault) == 12 && offsetof(LumoArrayFault, isActive) == 4 &&
               offsetof(LumoArrayFault, reserved) == 8);
LUMOLIB_ASSERT(sizeof(LumoSpaceStats) == 32 && offsetof(LumoSpaceStats, logicalSize) == 4 &&
               offsetof(LumoSpaceStats, committedSize) == 12 && offsetof(LumoSpaceStats, unsharedSize) == 20 &&
               offsetof(LumoSpaceStats, unsharedSizeValid) == 28);
LUMOLIB_ASSERT(sizeof(LumoInfo) == 12 && offsetof(LumoInfo, storageProfile) == 8);
LUMOLIB_ASSERT(sizeof(LumoUnsharedChunks) == 16 && offsetof(LumoUnsharedChunks, blockSize) == 0);
LUMOLIB_ASSERT(sizeof(LumoMetadataEntry) == 12 && offsetof(LumoMetadataEntry, value) == 4 &&
               offsetof(LumoMetadataEntry, next) == 8);
LUMOLIB_ASSERT(sizeof(LumoMetadata) == 4);
#endif

#undef LUMOLIB_ASSERT

#endif
