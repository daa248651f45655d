// SPDX-License-Identifier: Apache-2.0
//
// Mounting very many containers in a row: what the daemon is asked, and that its refusals stay its own.
#include "Fixture.h"

#include <algorithm>

namespace {

class ManyContainersTest : public KestrelTest {
protected:
    static std::string idOf(int number) {
        return "00000000-0000-0000-0000-" + std::to_string(100000000000 + number);
    }

    void exportMany(int count) {
        for (int number = 0; number < count; ++number) {
            daemon_->addContainer(idOf(number), "many-" + std::to_string(number));
        }
    }

    std::string addMessage(int number, std::vector<std::string> const &arrays = {}) {
        std::string id = idOf(number);
        return messageOf(
            [&] { FileSystemPointer(host_->AddLumoFileSystem("many-" + std::to_string(number), id, arrays, true)); });
    }

    void add(int first, int end) {
        for (int number = first; number < end; ++number) {
            ASSERT_EQ(addMessage(number), "");
        }
    }

    /// How many requests began so, of those since the last call.
    std::pair<int, int> findsAndLists() {
        auto const requests = daemon_->takeRequests();
        auto const lists = std::count(requests.begin(), requests.end(), "list");
        return {static_cast<int>(requests.size()) - static_cast<int>(lists), static_cast<int>(lists)};
    }

    static constexpr int singly = 16;
};

TEST_F(ManyContainersTest, AFewAreAskedAboutOneByOne) {
    exportMany(singly);
    add(0, singly);
    EXPECT_EQ(findsAndLists(), std::pair(singly, 0));
}

TEST_F(ManyContainersTest, ManyAreAskedAboutAtOnce) {
    exportMany(100);
    add(0, 100);
    EXPECT_EQ(findsAndLists(), std::pair(singly, 1));
    EXPECT_EQ(namesOfFileSystems().size(), 100U);
}

TEST_F(ManyContainersTest, AnAnswerCountsOnceForEachContainer) {
    exportMany(20);
    add(0, 20);
    findsAndLists();
    EXPECT_EQ(addMessage(18), "the storage container " + idOf(18) + " is mounted already, as 'many-18'");
    EXPECT_EQ(findsAndLists(), std::pair(1, 0));
}

TEST_F(ManyContainersTest, WhatIsExportedSinceIsAskedAbout) {
    exportMany(30);
    add(0, 20);
    findsAndLists();
    daemon_->addContainer(idOf(50), "many-50");
    EXPECT_EQ(addMessage(50), "");
    EXPECT_EQ(findsAndLists(), std::pair(1, 0));
}

TEST_F(ManyContainersTest, ARefusalIsTheDaemonsOwn) {
    exportMany(30);
    add(0, 20);
    EXPECT_EQ(addMessage(25, {"no-such-array"}), "no provider serves the array no-such-array");
    EXPECT_EQ(addMessage(40), "no provider exports the container " + idOf(40));
}

TEST_F(ManyContainersTest, AContainerThatIsGoneWhenAllAreAskedForIsRefused) {
    exportMany(20);
    add(0, singly);
    daemon_->removeContainer(idOf(singly));
    EXPECT_EQ(addMessage(singly), "no provider exports the container " + idOf(singly));
    daemon_->removeContainer(idOf(singly + 1));
    EXPECT_EQ(addMessage(singly + 1), "no provider exports the container " + idOf(singly + 1));
    EXPECT_EQ(namesOfFileSystems().size(), static_cast<std::size_t>(singly));
}

TEST_F(ManyContainersTest, WhenAllCannotBeToldEachIsStillAskedAbout) {
    exportMany(20);
    add(0, singly);
    findsAndLists();
    daemon_->failNext(Wire::ErrorCode::ProviderUnreachable, "an array does not answer");
    EXPECT_EQ(addMessage(singly), "");
    EXPECT_EQ(findsAndLists(), std::pair(2, 0)); // the failed one is noted as such, and counted here
}

TEST_F(ManyContainersTest, WithoutADaemonTheNextOneFails) {
    exportMany(30);
    add(0, singly);
    daemon_.reset();
    EXPECT_NE(addMessage(singly).find(at("run/lumod.sock")), std::string::npos);
    EXPECT_EQ(namesOfFileSystems().size(), static_cast<std::size_t>(singly));
}

TEST_F(ManyContainersTest, HandedOutFileSystemsGoOneByOneInAnyOrder) {
    // Names of every length, so that some end where a piece of memory does.
    constexpr int count = 200;
    exportMany(count);
    std::vector<std::string> names;
    for (int number = 0; number < count; ++number) {
        std::string id = idOf(number);
        names.push_back(std::to_string(number) + std::string(static_cast<std::size_t>(number), 'x'));
        FileSystemPointer const made(host_->AddLumoFileSystem(names.back(), id, {}, false));
        EXPECT_EQ(made->GetName(), names.back());
    }
    std::vector<FileSystemPointer> all;
    for (auto *const fileSystem : host_->GetLumoFileSystems()) {
        all.emplace_back(fileSystem);
    }
    ASSERT_EQ(all.size(), names.size());
    host_.reset();
    for (std::size_t place = 0; place < all.size(); place += 2) {
        all[place].reset();
    }
    for (std::size_t place = all.size(); place-- > 0;) {
        if (all[place]) {
            EXPECT_EQ(all[place]->GetName(), names[place]);
            EXPECT_EQ(all[place]->GetId(), idOf(static_cast<int>(place)));
            all[place].reset();
        }
    }
}

} // namespace
