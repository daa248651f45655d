// SPDX-License-Identifier: Apache-2.0
//
// Many threads, each with the host store opened for itself.
#include <atomic>
#include <string>
#include <vector>

#include "Host.h"

namespace ThreadsTest {

namespace {

using Store::HostStore;

class Stores : public Host {
protected:
    static std::string urlOf(int number, int round) {
        return "https://array" + std::to_string(number) + ".test/" + std::to_string(round);
    }
};

TEST_F(Stores, OfOneFileWriteInTurnAndReadWhatWasWritten) {
    constexpr int writers = 4;
    constexpr int rounds = 10;
    std::atomic<int> writing{writers};
    Crowd crowd;
    crowd.add(writers, [&](int number) {
        HostStore store(root(), HostStore::Mode::ReadWrite, std::chrono::seconds(60));
        std::string const name = "vp" + std::to_string(number);
        for (int round = 0; round < rounds; ++round) {
            store.putProviders({{name, urlOf(number, round), "", {}}});
            EXPECT_EQ(store.provider(name)->url, urlOf(number, round));
        }
        --writing;
    });
    crowd.add(2, [&](int) {
        HostStore store(root(), HostStore::Mode::QueryOnly, std::chrono::seconds(60));
        for (std::size_t before = 0; writing > 0;) {
            std::vector<Store::Provider> const providers = store.providers();
            EXPECT_EQ(providers.at(0), lab());
            EXPECT_GE(providers.size(), before);
            before = providers.size();
        }
    });
    crowd.finish();
    HostStore store(root(), HostStore::Mode::QueryOnly);
    EXPECT_EQ(store.providers().size(), writers + 1U);
    for (int number = 0; number < writers; ++number) {
        EXPECT_EQ(store.provider("vp" + std::to_string(number))->url, urlOf(number, rounds - 1));
    }
}

TEST_F(Stores, OfManyRootsKnowNothingOfEachOther) {
    Crowd crowd;
    crowd.add(6, [this](int number) {
        std::string const mine = root() + "/root" + std::to_string(number);
        HostStore store(mine, HostStore::Mode::ReadWrite);
        for (int round = 0; round < 5; ++round) {
            store.setEndpointOutage("pe" + std::to_string(number), round % 2 == 0);
            store.setOrkaContext(mine);
        }
        EXPECT_EQ(store.endpointOutages(), std::vector<std::string>{"pe" + std::to_string(number)});
        EXPECT_EQ(store.orkaContext(), mine);
        EXPECT_TRUE(store.providers().empty());
    });
    crowd.finish();
}

} // namespace

} // namespace ThreadsTest
