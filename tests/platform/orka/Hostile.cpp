// SPDX-License-Identifier: Apache-2.0
//
// Array files that somebody else has written: they say that they are one, and are not.
#include "Fixture.h"

using namespace Orka;

class HostileArrayFile : public OrkaTest {
protected:
    /// The failure that reading a file ends with, after statements ran on it; without the words about the file.
    std::string damage(std::string const &statements) {
        Stranger(path_).execute("PRAGMA ignore_check_constraints=1; PRAGMA foreign_keys=0; PRAGMA writable_schema=1; " +
                                statements);
        std::string sentence;
        try {
            ArrayFile file(path_);
            file.inventory();
            file.configVolumes(goldId, 10);
            file.unsharedChunks(goldId, webId);
            file.boundVolumes();
            file.hostContext();
            VolumeSpec spec;
            spec.containerId = goldId;
            spec.directoryName = "new";
            file.createVolume("key", spec);
        } catch (Wire::Failure const &failure) {
            EXPECT_EQ(failure.code(), Wire::ErrorCode::FileMalformed) << failure.sentence();
            sentence = failure.sentence();
        }
        std::string const standing = "the array file '" + path_ + "' is damaged: ";
        return sentence.compare(0, standing.size(), standing) == 0 ? sentence.substr(standing.size()) : sentence;
    }

    std::string const path_ = makeArray();
};

TEST_F(HostileArrayFile, fault_48_withAViewInThePlaceOfATableIsRefused) {
    EXPECT_EQ(
        damage("DROP TABLE metadata; CREATE VIEW metadata AS WITH RECURSIVE n(volume, position, key, value) AS "
               "(SELECT 1, 1, 'k', 'v' UNION ALL SELECT volume, position + 1, key, value FROM n) SELECT * FROM n"),
        "it holds something that does not belong there");
}

TEST_F(HostileArrayFile, fault_48_withATriggerIsRefused) {
    EXPECT_EQ(damage("CREATE TRIGGER t AFTER INSERT ON volume BEGIN DELETE FROM metadata; END"),
              "it holds something that does not belong there");
}

TEST_F(HostileArrayFile, fault_48_withAStatementThatMakesNothingIsRefused) {
    EXPECT_EQ(damage("UPDATE sqlite_schema SET sql = '' WHERE name = 'sqlite_autoindex_volume_1'"),
              "it holds something that does not belong there");
}

TEST_F(HostileArrayFile, fault_48_withATableTwiceIsRefused) {
    EXPECT_EQ(damage("INSERT INTO sqlite_schema SELECT * FROM sqlite_schema WHERE name = 'metadata'"),
              "malformed database schema (metadata) - table metadata already exists");
    EXPECT_EQ(damage("DELETE FROM sqlite_schema WHERE name = 'host_context'"),
              "malformed database schema (metadata) - table metadata already exists");
}

TEST_F(HostileArrayFile, fault_48_withoutAPartOfItsLayoutIsRefused) {
    EXPECT_EQ(damage("DROP TABLE metadata"), "a part of its layout is gone");
}

TEST_F(HostileArrayFile, fault_48_withATextWithoutAnEndIsRefused) {
    std::string const tooLong = "the array file '" + path_ + "' cannot be used: a row of it is longer than 2 MiB";
    EXPECT_EQ(damage("UPDATE storage_array SET name = printf('%.*c', 2200000, 'x')"), tooLong);
    EXPECT_EQ(damage("UPDATE storage_array SET name = printf('%.*c', 2000000, 'x')"), "");
    EXPECT_EQ(damage("UPDATE sqlite_schema SET sql = sql || printf('%.*c', 2200000, ' ') WHERE name = 'metadata'"),
              tooLong);
}

TEST_F(HostileArrayFile, fault_48_withoutABlockSizeIsRefused) {
    EXPECT_EQ(damage("UPDATE volume SET block_size = 0"),
              std::string("the virtual volume ") + webId + " has sizes that cannot be");
}

TEST_F(HostileArrayFile, fault_48_withNegativeSizesIsRefused) {
    EXPECT_EQ(damage("UPDATE volume SET size_mb = -1, committed_mb = -1, unshared_mb = -1"),
              std::string("the virtual volume ") + webId + " has sizes that cannot be");
}

TEST_F(HostileArrayFile, fault_48_withSizesThatContradictEachOtherIsRefused) {
    for (char const *const sizes : {
             "size_mb = 0, committed_mb = 0, unshared_mb = 0",
             "size_mb = 10, committed_mb = -1, unshared_mb = NULL",
             "size_mb = 10, committed_mb = 11, unshared_mb = 0",
             "size_mb = 10, committed_mb = 5, unshared_mb = -1",
             "size_mb = 10, committed_mb = 5, unshared_mb = 6",
             "size_mb = 10, committed_mb = 5, unshared_mb = 5, block_size = -1",
         }) {
        EXPECT_EQ(damage(std::string("UPDATE volume SET ") + sizes),
                  std::string("the virtual volume ") + webId + " has sizes that cannot be")
            << sizes;
    }
}

TEST_F(HostileArrayFile, fault_48_withAVolumeOfNoKindIsRefused) {
    EXPECT_EQ(damage("UPDATE volume SET kind = 7 WHERE kind = 1"),
              std::string("the virtual volume ") + dataId + " is of no kind");
}

TEST_F(HostileArrayFile, fault_48_withIdsThatAreNoneIsRefused) {
    EXPECT_EQ(damage("UPDATE volume SET uuid = '../' || uuid"), "a virtual volume has an id that is none");
    EXPECT_EQ(damage("UPDATE container SET id = upper(id)"), "a storage container has an id that is none");
}

TEST_F(HostileArrayFile, fault_48_withAContainerOfNoSizeIsRefused) {
    EXPECT_EQ(damage("UPDATE container SET max_lumo_size_mb = 0"),
              std::string("the storage container ") + goldId + " has no size");
    EXPECT_EQ(failureOf([this] { ArrayFile(path_).configVolumes(goldId, 10); }),
              "the array file '" + path_ + "' is damaged: the storage container " + goldId + " has no size");
}

TEST_F(HostileArrayFile, fault_48_withoutTheRowOfTheHostContextIsRefused) {
    EXPECT_EQ(damage("DELETE FROM host_context"), "it has no place for the host's context");
    EXPECT_EQ(codeOf([this] { ArrayFile(path_).setHostContext("context"); }), Wire::ErrorCode::FileMalformed);
}

TEST_F(HostileArrayFile, fault_48_withAnAnswerThatNobodyGaveIsRefused) {
    ArrayFile file(path_);
    VolumeSpec spec;
    spec.containerId = goldId;
    spec.directoryName = "new";
    file.createVolume("key", spec);
    for (char const *const sizes : {"size_mb = -1", "size_mb = 1, block_size = 0"}) {
        EXPECT_EQ(damage(std::string("UPDATE answer SET ") + sizes),
                  "the answer to an earlier request has sizes that cannot be");
    }
    EXPECT_EQ(damage("UPDATE answer SET uuid = NULL"), "the answer to an earlier request names no virtual volume");
    EXPECT_EQ(ArrayFile(path_).counts().configVolumes, 3);
}
