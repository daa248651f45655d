// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

using namespace Orka;

class ReadingAnArrayFile : public OrkaTest {
protected:
    ArrayFile file_{makeArray()};
};

TEST_F(ReadingAnArrayFile, givesArraysWithEverythingThatTheTopologyTold) {
    auto const arrays = file_.inventory().arrays;
    ASSERT_EQ(arrays.size(), 2U);
    StorageArray const one{"array-1",
                           "One",
                           "V1",
                           "M1",
                           {{"pe-1", 0, "naa.1", std::nullopt, {}, true, true},
                            {"pe-2", 1, "192.0.2.2", "/two", {}, true, false},
                            {"pe-down", 0, std::nullopt, std::nullopt, {}, false, true},
                            {std::nullopt, -7, std::nullopt, std::nullopt, {}, true, true}}};
    EXPECT_EQ(arrays[0], one);
    StorageArray const two{"array-2",
                           "",
                           "",
                           "",
                           {{"pe-3", 2, "/three", std::nullopt, {"192.0.2.3", "192.0.2.4"}, true, true},
                            {"pe-4", 2, std::nullopt, std::nullopt, {}, true, true}}};
    EXPECT_EQ(arrays[1], two);
}

TEST_F(ReadingAnArrayFile, givesContainersWithTheirArraysInOrder) {
    std::vector<StorageContainer> const expected{{goldId, "gold", 8192, {"array-2", "array-1"}},
                                                 {silverId, "silver", 100, {"array-2"}}};
    EXPECT_EQ(file_.inventory().containers, expected);
}

TEST_F(ReadingAnArrayFile, givesAContainerWithoutArraysAnEmptyList) {
    ArrayFile other(makeArray("other.array", R"({"arrays": [{"id": "a"}], "containers": [
        {"id": "00000000000040008000000000000001", "name": "x", "maxLumoSizeMb": 1},
        {"id": "00000000000040008000000000000002", "name": "y", "maxLumoSizeMb": 1, "arrays": ["a"]},
        {"id": "00000000000040008000000000000003", "name": "z", "maxLumoSizeMb": 1, "arrays": []}]})"));
    auto const containers = other.inventory().containers;
    ASSERT_EQ(containers.size(), 3U);
    EXPECT_TRUE(containers[0].arrayIds.empty());
    EXPECT_EQ(containers[1].arrayIds, std::vector<std::string>{"a"});
    EXPECT_TRUE(containers[2].arrayIds.empty());
    EXPECT_TRUE(other.inventory().arrays[0].endpoints.empty());
}

TEST_F(ReadingAnArrayFile, givesAVolumeWithAllItsFacts) {
    VirtualVolume const web{webId, goldId, VolumeKind::Config, "web", 1000, 500, 250, "fast",
                            4096,  "vm-1", std::nullopt};
    EXPECT_EQ(file_.volume(goldId, webId), web);
}

TEST_F(ReadingAnArrayFile, leavesOutWhatTheArrayCannotTell) {
    VirtualVolume const bare{bareId,  goldId, VolumeKind::Config, "bare", 4096, 0, std::nullopt, std::nullopt,
                             1048576, "",     std::nullopt};
    EXPECT_EQ(file_.volume(goldId, bareId), bare);
    EXPECT_EQ(file_.spaceStats(goldId, bareId), (SpaceStats{4096, 0, std::nullopt}));
    EXPECT_EQ(file_.spaceStats(goldId, webId), (SpaceStats{1000, 500, 250}));
}

TEST_F(ReadingAnArrayFile, acceptsOtherSpellingsOfIds) {
    EXPECT_EQ(file_.volume("{00000000-0000-4000-8000-00000000000A}", "10000000000040008000000000000001").directoryName,
              "web");
}

TEST_F(ReadingAnArrayFile, namesWhatIsNotThere) {
    EXPECT_EQ(failureOf([&] { file_.volume(goldId, noVolume); }),
              "there is no virtual volume 10000000-0000-4000-8000-00000000000f in the storage container "
              "00000000-0000-4000-8000-00000000000a");
    EXPECT_EQ(codeOf([&] { file_.volume(goldId, noVolume); }), Wire::ErrorCode::NoSuchVolume);
    EXPECT_EQ(failureOf([&] { file_.volume(noContainer, webId); }),
              "there is no storage container 00000000-0000-4000-8000-00000000000f");
    EXPECT_EQ(codeOf([&] { file_.configVolumes(noContainer, 1); }), Wire::ErrorCode::NoSuchContainer);
    EXPECT_EQ(codeOf([&] { file_.presence(noContainer, {}); }), Wire::ErrorCode::NoSuchContainer);
    EXPECT_EQ(codeOf([&] { file_.volumeByDirectoryName(noContainer, "web"); }), Wire::ErrorCode::NoSuchContainer);
    EXPECT_EQ(codeOf([&] { file_.spaceStats(goldId, noVolume); }), Wire::ErrorCode::NoSuchVolume);
    EXPECT_EQ(codeOf([&] { file_.unsharedChunks(goldId, noVolume); }), Wire::ErrorCode::NoSuchVolume);
    EXPECT_EQ(codeOf([&] { file_.metadata(goldId, noVolume); }), Wire::ErrorCode::NoSuchVolume);
}

TEST_F(ReadingAnArrayFile, findsAVolumeOnlyInItsOwnContainer) {
    EXPECT_EQ(codeOf([&] { file_.volume(silverId, webId); }), Wire::ErrorCode::NoSuchVolume);
    EXPECT_FALSE(file_.presence(silverId, {webId})[0].exists);
    EXPECT_FALSE(file_.volumeByDirectoryName(silverId, "web"));
}

TEST_F(ReadingAnArrayFile, listsConfigVolumesAndNoOthers) {
    std::vector<ConfigVolume> const expected{{webId, "web", std::nullopt}, {bareId, "bare", std::nullopt}};
    EXPECT_EQ(file_.configVolumes(goldId, 2147483647), expected);
    EXPECT_TRUE(file_.configVolumes(silverId, 2147483647).empty());
}

TEST_F(ReadingAnArrayFile, listsNoMoreConfigVolumesThanAskedFor) {
    EXPECT_EQ(file_.configVolumes(goldId, 1).size(), 1U);
    EXPECT_TRUE(file_.configVolumes(goldId, 0).empty());
    EXPECT_TRUE(file_.configVolumes(goldId, -1).empty());
}

TEST_F(ReadingAnArrayFile, tellsOfEachIdWhetherItExistsAndWhatItIsBoundTo) {
    std::vector<VolumePresence> const expected{
        {true, std::nullopt}, {false, std::nullopt}, {true, "pe-1"}, {false, std::nullopt}, {true, std::nullopt}};
    EXPECT_EQ(file_.presence(goldId, {webId, noVolume, dataId, "no uuid at all", webId}), expected);
    EXPECT_TRUE(file_.presence(goldId, {}).empty());
}

TEST_F(ReadingAnArrayFile, findsAConfigVolumeByItsDirectoryName) {
    auto const found = file_.volumeByDirectoryName(goldId, "bare");
    ASSERT_TRUE(found);
    EXPECT_EQ(found->uuid, bareId);
    EXPECT_FALSE(file_.volumeByDirectoryName(goldId, "Bare"));
    EXPECT_FALSE(file_.volumeByDirectoryName(goldId, ""));
}

TEST_F(ReadingAnArrayFile, listsBoundVolumesOfAllContainers) {
    auto const bound = file_.boundVolumes();
    ASSERT_EQ(bound.size(), 1U);
    EXPECT_EQ(bound[0].uuid, dataId);
    EXPECT_EQ(bound[0].containerId, goldId);
    EXPECT_EQ(bound[0].boundTo, "pe-1");
}

TEST_F(ReadingAnArrayFile, keepsTheOrderAndTheDoublesOfMetadata) {
    Metadata const expected{{"k", "1"}, {"a", ""}, {"k", "1"}};
    EXPECT_EQ(file_.metadata(goldId, webId), expected);
    EXPECT_TRUE(file_.metadata(goldId, bareId).empty());
}

TEST_F(ReadingAnArrayFile, marksAsManyChunksAsAreUnshared) {
    auto const chunks = file_.unsharedChunks(goldId, webId);
    EXPECT_EQ(chunks.blockSize, 4096);
    ASSERT_EQ(chunks.bitmap.size(), 1000U * 256 / 8);
    int64_t marked = 0;
    for (auto const byte : chunks.bitmap) {
        marked += __builtin_popcount(byte);
    }
    EXPECT_EQ(marked, 250 * 256);
}

TEST_F(ReadingAnArrayFile, givesNoBitmapWhenTheArrayCannotTellWhatIsShared) {
    EXPECT_EQ(file_.unsharedChunks(goldId, bareId), (UnsharedChunks{1048576, {}}));
}

TEST_F(ReadingAnArrayFile, givesNoBitmapBeyondTheLimitHoweverLargeTheVolume) {
    ArrayFile other(makeArray("huge.array", R"({"arrays": [], "containers": [
        {"id": "00000000000040008000000000000001", "name": "x", "maxLumoSizeMb": 9223372036854775807, "volumes": [
        {"uuid": "00000000000040008000000000000002", "directoryName": "h", "sizeMb": 9223372036854775807,
         "committedMb": 9223372036854775807, "unsharedMb": 9223372036854775807, "blockSize": 512},
        {"uuid": "00000000000040008000000000000003", "directoryName": "odd", "sizeMb": 3, "committedMb": 3,
         "unsharedMb": 3, "blockSize": 2097152}]}]})"));
    auto const container = "00000000-0000-4000-8000-000000000001";
    auto const huge = other.unsharedChunks(container, "00000000-0000-4000-8000-000000000002");
    EXPECT_EQ(huge.bitmap, std::vector<uint8_t>(static_cast<size_t>(UnsharedChunks::maxChunks / 8), 0xff));
    auto const odd = other.unsharedChunks(container, "00000000-0000-4000-8000-000000000003");
    EXPECT_EQ(odd.bitmap, std::vector<uint8_t>{0x03});
}

TEST_F(ReadingAnArrayFile, countsWhatItHolds) {
    EXPECT_EQ(file_.counts(), (ArrayFileCounts{2, 6, 2, 2, 1, 1, 3}));
}

TEST_F(ReadingAnArrayFile, showsAnotherConnectionsCommitInTheDataVersion) {
    auto const before = file_.inventory().dataVersion;
    EXPECT_EQ(file_.dataVersion(), before);
    Stranger(at("test.array")).execute("UPDATE container SET name = 'platinum' WHERE name = 'gold'");
    EXPECT_NE(file_.dataVersion(), before);
    EXPECT_EQ(file_.inventory().containers[0].name, "platinum");
}

TEST_F(ReadingAnArrayFile, reads100000VolumesPairsAndContainers) {
    std::string json = R"({"arrays": [{"id": "a"}], "containers": [)";
    char text[200];
    for (int number = 0; number < 100000; ++number) {
        std::snprintf(text, sizeof text,
                      R"({"id": "000000000000400080000000%08d", "name": "c%d", "maxLumoSizeMb": 1, "arrays": ["a"]},)",
                      number, number);
        json += text;
    }
    json += R"({"id": "00000000000040008000000100000000", "name": "last", "maxLumoSizeMb": 1, "volumes": [)";
    json += R"({"uuid": "00000000000040008000000200000000", "directoryName": "d", "metadata": [)";
    for (int number = 0; number < 100000; ++number) {
        std::snprintf(text, sizeof text, R"(%s{"key": "k%d", "value": "v"})", number == 0 ? "" : ",", number);
        json += text;
    }
    json += "]}";
    for (int number = 1; number < 100000; ++number) {
        std::snprintf(text, sizeof text, R"(,{"uuid": "000000000000400080000002%08d", "directoryName": "d%d"})", number,
                      number);
        json += text;
    }
    json += "]}]}";
    ArrayFile other(makeArray("large.array", json));
    auto const inventory = other.inventory();
    ASSERT_EQ(inventory.containers.size(), 100001U);
    EXPECT_EQ(inventory.containers[77777].name, "c77777");
    EXPECT_EQ(inventory.containers[99999].arrayIds.size(), 1U);
    auto const container = "00000000-0000-4000-8000-000100000000";
    auto const volumes = other.configVolumes(container, 2147483647);
    ASSERT_EQ(volumes.size(), 100000U);
    EXPECT_EQ(volumes[99999].directoryName, "d99999");
    auto const pairs = other.metadata(container, volumes[0].uuid);
    ASSERT_EQ(pairs.size(), 100000U);
    EXPECT_EQ(pairs[99999].key, "k99999");
}
