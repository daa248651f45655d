// SPDX-License-Identifier: Apache-2.0
//
// Array makers' 32-bit tools read these records directly. The numbers stand here a second time, on purpose: an edit of
// the header that takes its own assertions along must still fail.
#include <cstddef>

#include <gtest/gtest.h>

#include "lumolib/LumoLib.h"

namespace {

static_assert(sizeof(void *) == 4, "built for 32 bits only");

TEST(Records, LumoErrorEx) {
    EXPECT_EQ(offsetof(LumoErrorEx, code), 0U);
    EXPECT_EQ(offsetof(LumoErrorEx, text), 4U);
    EXPECT_EQ(sizeof(LumoErrorEx), 256U);
}

TEST(Records, EndpointTransportInfo) {
    EXPECT_EQ(offsetof(EndpointTransportInfo, type), 0U);
    EXPECT_EQ(offsetof(EndpointTransportInfo, text1), 4U);
    EXPECT_EQ(offsetof(EndpointTransportInfo, text2), 8U);
    EXPECT_EQ(sizeof(EndpointTransportInfo), 12U);
}

TEST(Records, ProtocolEndpointInfo) {
    EXPECT_EQ(offsetof(ProtocolEndpointInfo, localUID), 0U);
    EXPECT_EQ(offsetof(ProtocolEndpointInfo, reserved1), 4U);
    EXPECT_EQ(offsetof(ProtocolEndpointInfo, nfs4xAddresses), 12U);
    EXPECT_EQ(offsetof(ProtocolEndpointInfo, nfs4xAddressCount), 16U);
    EXPECT_EQ(offsetof(ProtocolEndpointInfo, reserved2), 20U);
    EXPECT_EQ(offsetof(ProtocolEndpointInfo, transport), 28U);
    EXPECT_EQ(offsetof(ProtocolEndpointInfo, isAccessible), 32U);
    EXPECT_EQ(offsetof(ProtocolEndpointInfo, isConfigured), 33U);
    EXPECT_EQ(sizeof(ProtocolEndpointInfo), 36U);
}

TEST(Records, StorageArrayInfo) {
    EXPECT_EQ(offsetof(StorageArrayInfo, arrayId), 0U);
    EXPECT_EQ(offsetof(StorageArrayInfo, name), 4U);
    EXPECT_EQ(offsetof(StorageArrayInfo, vendorId), 8U);
    EXPECT_EQ(offsetof(StorageArrayInfo, modelId), 12U);
    EXPECT_EQ(offsetof(StorageArrayInfo, endpointCount), 16U);
    EXPECT_EQ(offsetof(StorageArrayInfo, endpoints), 20U);
    EXPECT_EQ(sizeof(StorageArrayInfo), 24U);
}

TEST(Records, StorageContainerInfo) {
    EXPECT_EQ(offsetof(StorageContainerInfo, name), 0U);
    EXPECT_EQ(offsetof(StorageContainerInfo, providerUrl), 4U);
    EXPECT_EQ(offsetof(StorageContainerInfo, id), 8U);
    EXPECT_EQ(offsetof(StorageContainerInfo, arrayCount), 12U);
    EXPECT_EQ(offsetof(StorageContainerInfo, maxLumoSizeMb), 16U);
    EXPECT_EQ(offsetof(StorageContainerInfo, reserved), 24U);
    EXPECT_EQ(offsetof(StorageContainerInfo, arrays), 28U);
    EXPECT_EQ(sizeof(StorageContainerInfo), 32U);
}

TEST(Records, StorageContainerResult) {
    EXPECT_EQ(offsetof(StorageContainerResult, containerCount), 0U);
    EXPECT_EQ(offsetof(StorageContainerResult, containers), 4U);
    EXPECT_EQ(sizeof(StorageContainerResult), 8U);
}

TEST(Records, LumoQueryEntry) {
    EXPECT_EQ(offsetof(LumoQueryEntry, id), 0U);
    EXPECT_EQ(offsetof(LumoQueryEntry, directoryName), 4U);
    EXPECT_EQ(sizeof(LumoQueryEntry), 8U);
}

TEST(Records, LumoQueryResultHoldsItsPointersInline) {
    EXPECT_EQ(offsetof(LumoQueryResult, count), 0U);
    EXPECT_EQ(offsetof(LumoQueryResult, entries), 4U);
    EXPECT_EQ(sizeof(LumoQueryResult), 8U);
}

TEST(Records, LumoArrayFault) {
    EXPECT_EQ(offsetof(LumoArrayFault, arrayId), 0U);
    EXPECT_EQ(offsetof(LumoArrayFault, isActive), 4U);
    EXPECT_EQ(offsetof(LumoArrayFault, reserved), 8U);
    EXPECT_EQ(sizeof(LumoArrayFault), 12U);
}

TEST(Records, LumoSpaceStats) {
    EXPECT_EQ(offsetof(LumoSpaceStats, reserved), 0U);
    EXPECT_EQ(offsetof(LumoSpaceStats, logicalSize), 4U);
    EXPECT_EQ(offsetof(LumoSpaceStats, committedSize), 12U);
    EXPECT_EQ(offsetof(LumoSpaceStats, unsharedSize), 20U);
    EXPECT_EQ(offsetof(LumoSpaceStats, unsharedSizeValid), 28U);
    EXPECT_EQ(sizeof(LumoSpaceStats), 32U);
}

TEST(Records, LumoInfo) {
    EXPECT_EQ(offsetof(LumoInfo, reserved1), 0U);
    EXPECT_EQ(offsetof(LumoInfo, reserved2), 4U);
    EXPECT_EQ(offsetof(LumoInfo, storageProfile), 8U);
    EXPECT_EQ(sizeof(LumoInfo), 12U);
}

TEST(Records, LumoUnsharedChunks) {
    EXPECT_EQ(offsetof(LumoUnsharedChunks, blockSize), 0U);
    EXPECT_EQ(offsetof(LumoUnsharedChunks, chunkCount), 8U);
    EXPECT_EQ(sizeof(LumoUnsharedChunks), 16U);
}

TEST(Records, LumoMetadata) {
    EXPECT_EQ(offsetof(LumoMetadataEntry, key), 0U);
    EXPECT_EQ(offsetof(LumoMetadataEntry, value), 4U);
    EXPECT_EQ(offsetof(LumoMetadataEntry, next), 8U);
    EXPECT_EQ(sizeof(LumoMetadataEntry), 12U);
    EXPECT_EQ(offsetof(LumoMetadata, first), 0U);
    EXPECT_EQ(sizeof(LumoMetadata), 4U);
}

} // namespace
