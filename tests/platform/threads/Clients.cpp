// SPDX-License-Identifier: Apache-2.0
//
// Many threads, each with a client of its own, at one daemon: every answer is whole and is the asker's.
#include <atomic>
#include <string>
#include <vector>

#include "Host.h"
#include "lumolib/LastFailure.h"
#include "lumolib/LumoLib.h"

namespace ThreadsTest {

namespace {

using LumoClient::Channel;
using LumoClient::Client;
using LumoClient::Volume;

constexpr int crowdSize = 8;

/// Tells the others that the thread which they wait for has ended, however it did.
class End {
public:
    explicit End(std::atomic<bool> &over)
        : over_(over) {}
    ~End() {
        over_ = true;
    }

private:
    std::atomic<bool> &over_;
};

class Clients : public Host {
protected:
    /// One volume's whole life, on either channel.
    static void live(Client &client, std::string const &name, Channel channel) {
        LumoClient::NewVolume wanted;
        wanted.containerId = gold;
        wanted.directoryName = name;
        wanted.sizeMb = 1;
        Volume const made = client.createVirtualVolume(wanted, channel);
        EXPECT_EQ(made.directoryName, name);
        EXPECT_EQ(made.uuid.size(), 36U);
        Volume const bound = client.bindVirtualVolume({gold, made.uuid, ""}, channel);
        EXPECT_EQ(bound.uuid, made.uuid);
        EXPECT_NE(bound.endpoint, "");
        EXPECT_EQ(client.checkLumoAccessibility(gold, {made.uuid, "00000000-0000-0000-0000-000000000000"}),
                  (std::vector<std::uint8_t>{3, 0}));
        client.unbindVirtualVolume({gold, made.uuid, ""}, channel);
        EXPECT_EQ(client.deleteVirtualVolume({gold, "", name}, channel).uuid, made.uuid);
    }
    static std::string nameOf(Client &client) {
        return client.findStorageContainer(gold, {}).name;
    }
};

TEST_F(Clients, OfManyThreadsGetTheirOwnAnswers) {
    startDaemon();
    Crowd crowd;
    crowd.add(crowdSize, [this](int number) {
        Client client(settings());
        Channel const channel = number % 2 == 0 ? Channel::Ordered : Channel::Priority;
        for (int round = 0; round < 8; ++round) {
            live(client, "vm" + std::to_string(number), channel);
            for (int read = 0; read < 50; ++read) {
                EXPECT_EQ(nameOf(client), "gold");
                EXPECT_EQ(client.ping().root, root());
            }
        }
    });
    crowd.finish();
    EXPECT_EQ(threadsOfDaemon(), 1U);
    EXPECT_EQ(stopDaemon(), 0);
}

TEST_F(Clients, SeeAProviderThatComesAndGoesWholeOrNotAtAll) {
    startDaemon();
    std::string const gone = "23: no registered provider exports a storage container " + std::string(gold);
    std::atomic<bool> over{false};
    Crowd crowd;
    std::atomic<int> sawIt{0};
    std::atomic<int> missedIt{0};
    crowd.add(crowdSize, [&](int) {
        Client client(settings());
        while (!over) {
            std::string const failure = failureOf([&client] { EXPECT_EQ(nameOf(client), "gold"); });
            EXPECT_TRUE(failure.empty() || failure == gone) << failure;
            ++(failure.empty() ? sawIt : missedIt);
        }
    });
    // Until everybody can have seen both: each state stays until somebody has seen it.
    crowd.add(1, [&](int) {
        End const end(over);
        Store::HostStore store(root(), Store::HostStore::Mode::ReadWrite);
        for (int round = 0; round < 20; ++round) {
            EXPECT_TRUE(store.removeProvider("lab"));
            for (int const missed = missedIt; missedIt == missed;) {
                std::this_thread::yield();
            }
            store.putProviders({lab()});
            for (int const seen = sawIt; sawIt == seen;) {
                std::this_thread::yield();
            }
        }
    });
    crowd.finish();
    EXPECT_GE(sawIt, 20);
    EXPECT_GE(missedIt, 20);
    EXPECT_EQ(stopDaemon(), 0);
}

TEST_F(Clients, MeetAFaultThatIsSwitchedWhileTheyAsk) {
    startDaemon();
    setenv("TOVI_ROOT", root().c_str(), 1);
    ASSERT_TRUE(LumoLib_Init(0, 0));
    std::atomic<int> done{0};
    std::atomic<int> refused{0};
    std::atomic<bool> over{false};
    Crowd crowd;
    std::string const struck = "80: injected fault STORAGE_FAULT in queryStorageContainer of provider 'lab'";
    crowd.add(crowdSize, [&](int) {
        Client client(settings());
        while (!over) {
            std::string const failure = failureOf([&client] { EXPECT_EQ(nameOf(client), "gold"); });
            EXPECT_TRUE(failure.empty() || failure == struck) << failure;
            ++(failure.empty() ? done : refused);
        }
    });
    crowd.add(1, [&](int) {
        End const end(over);
        ASSERT_TRUE(LumoLib_SetFaultInjectionEnabled(true));
        ASSERT_TRUE(LumoLib_AddFaultInjectionRule("STORAGE_FAULT", "queryStorageContainer", 1, 0));
        for (int round = 0; round < 40; ++round) {
            std::atomic<int> const &awaited = round % 2 == 0 ? refused : done;
            EXPECT_TRUE(LumoLib_SetFaultInjectionEnabled(round % 2 == 0));
            for (int const before = awaited; awaited == before;) {
                std::this_thread::yield();
            }
        }
    });
    crowd.finish();
    LumoLib_Exit();
    EXPECT_EQ(stopDaemon(), 0);
}

TEST_F(Clients, OutliveADaemonThatEndsWhileTheyAsk) {
    startDaemon();
    std::atomic<int> served{0};
    std::atomic<int> lost{0};
    std::atomic<bool> isBack{false};
    Crowd crowd;
    crowd.add(crowdSize, [&](int number) {
        Client client(settings());
        std::string failure;
        for (; failure.empty(); ++served) {
            failure = failureOf([&] { live(client, "vm" + std::to_string(number), Channel::Ordered); });
        }
        EXPECT_NE(failure.find(root() + "/run/lumod.sock"), std::string::npos) << failure;
        ++lost;
        lost.notify_all();
        isBack.wait(false);
        EXPECT_EQ(nameOf(client), "gold");
    });
    crowd.begin();
    while (served < 2 * crowdSize) {
        std::this_thread::yield();
    }
    EXPECT_EQ(stopDaemon(), 0);
    for (int seen = lost; seen < crowdSize; seen = lost) {
        lost.wait(seen);
    }
    startDaemon();
    isBack = true;
    isBack.notify_all();
    crowd.finish();
    EXPECT_EQ(stopDaemon(), 0);
}

} // namespace

} // namespace ThreadsTest
