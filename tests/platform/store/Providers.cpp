// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

namespace {

using Store::HostStore;
using Store::Provider;

class ProvidersTest : public StoreTest {
protected:
    HostStore store_{root_, HostStore::Mode::ReadWrite};
};

Provider const first{"first", "file:///a.array", "aux", {{"array-2", true, 5}, {"array-1", false, INT32_MIN}}};
Provider const second{"second", "", "", {}};

TEST_F(ProvidersTest, AnAbsentStoreHasNoneAndStaysAbsent) {
    EXPECT_TRUE(store_.providers().empty());
    EXPECT_FALSE(store_.provider("first"));
    EXPECT_FALSE(store_.hasProvider("first"));
    EXPECT_FALSE(store_.removeProvider("first"));
    store_.putProviders({});
    EXPECT_FALSE(exists(root_));
}

TEST_F(ProvidersTest, ComeBackAsTheyWerePut) {
    store_.putProviders({first, second});
    EXPECT_EQ(store_.provider("first"), first);
    EXPECT_EQ(store_.provider("second"), second);
    EXPECT_FALSE(store_.provider("First"));
    EXPECT_TRUE(store_.hasProvider("second"));
    HostStore again(root_, HostStore::Mode::QueryOnly);
    EXPECT_EQ(again.providers(), (std::vector<Provider>{first, second}));
}

TEST_F(ProvidersTest, AReplacedRecordKeepsItsPlaceAndNothingOfTheOldOne) {
    store_.putProviders({first});
    store_.putProviders({second});
    Provider const changed{"first", "https://b", "", {{"array-9", true, 0}}};
    store_.putProviders({changed});
    EXPECT_EQ(store_.providers(), (std::vector<Provider>{changed, second}));
}

TEST_F(ProvidersTest, OneArrayMayBeNamedTwice) {
    Provider const twice{"p", "u", "", {{"a", true, 1}, {"a", false, 2}}};
    store_.putProviders({twice});
    EXPECT_EQ(store_.provider("p"), twice);
}

TEST_F(ProvidersTest, AnEmptyNameIsAName) {
    store_.putProviders({{"", "u", "", {}}});
    EXPECT_TRUE(store_.hasProvider(""));
    EXPECT_TRUE(store_.removeProvider(""));
    EXPECT_FALSE(store_.hasProvider(""));
}

TEST_F(ProvidersTest, AreRemovedWithTheirArrays) {
    store_.putProviders({first, second});
    EXPECT_TRUE(store_.removeProvider("first"));
    EXPECT_FALSE(store_.removeProvider("first"));
    EXPECT_EQ(store_.providers(), std::vector<Provider>{second});
    store_.putProviders({{"first", "", "", {}}});
    EXPECT_TRUE(store_.provider("first")->arrays.empty());
}

TEST_F(ProvidersTest, APutThatFailsHalfWayChangesNothing) {
    store_.putProviders({first});
    plainSql("CREATE TRIGGER refuse BEFORE INSERT ON provider_array WHEN new.array_id = 'bad' "
             "BEGIN SELECT RAISE(ABORT, 'refused'); END");
    auto const failure = failureOf([&] {
        store_.putProviders({second, {"first", "changed", "", {}}, {"third", "", "", {{"bad", true, 0}}}});
    });
    ASSERT_TRUE(failure);
    EXPECT_EQ(failure->code(), Wire::ErrorCode::InternalError);
    EXPECT_EQ(store_.providers(), std::vector<Provider>{first});
}

TEST_F(ProvidersTest, WritingARecordBackAsItWasReadDoesNotTouchTheFile) {
    store_.putProviders({first});
    HostStore watcher(root_, HostStore::Mode::QueryOnly);
    int64_t const before = watcher.dataVersion();
    store_.putProviders({first});
    EXPECT_EQ(watcher.dataVersion(), before);
}

} // namespace
