// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

#include <filesystem>

namespace {

using Store::HostStore;

class SettingsTest : public StoreTest {
protected:
    HostStore store_{root_, HostStore::Mode::ReadWrite};
};

TEST_F(SettingsTest, OutagesBeginAndEnd) {
    EXPECT_TRUE(store_.endpointOutages().empty());
    store_.setEndpointOutage("pe-2", false);
    EXPECT_FALSE(exists(root_));
    store_.setEndpointOutage("pe-2", true);
    store_.setEndpointOutage("pe-1", true);
    store_.setEndpointOutage("pe-1", true);
    EXPECT_EQ(store_.endpointOutages(), (std::vector<std::string>{"pe-1", "pe-2"}));
    store_.setEndpointOutage("pe-1", false);
    EXPECT_EQ(store_.endpointOutages(), std::vector<std::string>{"pe-2"});
}

TEST_F(SettingsTest, TheOrkaContextIsKeptAsItWasGiven) {
    EXPECT_FALSE(store_.orkaContext());
    store_.clearOrkaContext();
    EXPECT_FALSE(exists(root_));
    store_.setOrkaContext("any Text");
    store_.setOrkaContext("another");
    EXPECT_EQ(store_.orkaContext(), "another");
    store_.clearOrkaContext();
    store_.clearOrkaContext();
    EXPECT_FALSE(store_.orkaContext());
}

TEST_F(SettingsTest, AReaderNeitherMakesNorChangesTheStore) {
    HostStore reader(root_, HostStore::Mode::QueryOnly);
    EXPECT_TRUE(reader.providers().empty());
    EXPECT_FALSE(reader.orkaContext());
    EXPECT_FALSE(exists(root_));
    auto const failure = failureOf([&] { reader.setOrkaContext("x"); });
    ASSERT_TRUE(failure);
    EXPECT_EQ(failure->code(), Wire::ErrorCode::FileReadOnly);
    EXPECT_EQ(failure->sentence(), "the host store '" + file() + "' was opened for reading only");
    EXPECT_FALSE(exists(root_));
}

TEST_F(SettingsTest, AReaderSeesTheStoreAppearChangeAndGo) {
    HostStore reader(root_, HostStore::Mode::QueryOnly);
    int64_t const absent = reader.dataVersion();
    EXPECT_EQ(reader.dataVersion(), absent);

    store_.setOrkaContext("one");
    int64_t const made = reader.dataVersion();
    EXPECT_NE(made, absent);
    EXPECT_EQ(reader.orkaContext(), "one");
    EXPECT_EQ(reader.dataVersion(), made);

    store_.setOrkaContext("two");
    int64_t const changed = reader.dataVersion();
    EXPECT_NE(changed, made);

    std::filesystem::remove(file());
    int64_t const gone = reader.dataVersion();
    EXPECT_NE(gone, changed);
    EXPECT_FALSE(reader.orkaContext());

    HostStore(root_, HostStore::Mode::ReadWrite).setOrkaContext("three");
    EXPECT_NE(reader.dataVersion(), gone);
    EXPECT_EQ(reader.orkaContext(), "three");
}

} // namespace
