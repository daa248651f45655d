// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "FakeVendor.h"
#include "ProviderSet.h"

namespace LumodTest {
namespace {

Store::Provider recordOf(std::string const &name) {
    return {name, "fake:" + name, "", {{"a1", true, 1}}};
}

std::unique_ptr<Orka::Provider> makeNone(std::string const &) {
    return nullptr;
}

TEST(ProviderSet, RecordsThatStayTheSameLeaveTheRevision) {
    Lumod::ProviderSet providers(makeNone);
    providers.apply({recordOf("north"), recordOf("south")});
    uint64_t const revision = providers.revision();
    auto const before = providers.all();
    providers.apply({recordOf("north"), recordOf("south")});
    EXPECT_EQ(providers.revision(), revision);
    EXPECT_EQ(providers.all(), before);
}

TEST(ProviderSet, EveryChangeOfARecordChangesTheRevision) {
    Lumod::ProviderSet providers(makeNone);
    providers.apply({recordOf("north")});
    Store::Provider changed = recordOf("north");
    changed.arrays.front().priority = 2;
    std::vector<std::vector<Store::Provider>> const next = {
        {changed}, {recordOf("north")}, {recordOf("north"), recordOf("south")}, {recordOf("south")}, {}};
    for (auto const &records : next) {
        uint64_t const revision = providers.revision();
        providers.apply(records);
        EXPECT_NE(providers.revision(), revision);
        EXPECT_EQ(providers.all().size(), records.size());
    }
}

} // namespace
} // namespace LumodTest
