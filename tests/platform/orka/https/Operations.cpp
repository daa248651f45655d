// SPDX-License-Identifier: Apache-2.0
#include "HttpsFixture.h"

namespace {

using Orka::VolumeSpec;
using Wire::ErrorCode;

class HttpsOperationTest : public HttpsTest {
protected:
    HttpsOperationTest() {
        serve();
    }

    /// A list of three pages in the container of gold.
    void makeManyVolumes();
};

TEST_F(HttpsOperationTest, answersAsTheArrayBehindIt) {
    EXPECT_EQ(*get(client_->queryStorageArray(context())).items, *get(embedded_->queryStorageArray(context())).items);
    EXPECT_EQ(*get(client_->queryStorageContainer(context())).items,
              *get(embedded_->queryStorageContainer(context())).items);
    for (auto const *uuid : {webId, bareId, dataId}) {
        EXPECT_EQ(get(client_->queryVirtualVolume(context(), goldId, uuid)),
                  get(embedded_->queryVirtualVolume(context(), goldId, uuid)));
        EXPECT_EQ(get(client_->spaceStatsForVirtualVolume(context(), goldId, uuid)),
                  get(embedded_->spaceStatsForVirtualVolume(context(), goldId, uuid)));
        EXPECT_EQ(get(client_->unsharedChunksVirtualVolume(context(), goldId, uuid)),
                  get(embedded_->unsharedChunksVirtualVolume(context(), goldId, uuid)));
        EXPECT_EQ(get(client_->getMetadata(context(), goldId, uuid)),
                  get(embedded_->getMetadata(context(), goldId, uuid)));
    }
    EXPECT_EQ(get(client_->queryVirtualVolumesOfContainer(context(), goldId, 10)),
              get(embedded_->queryVirtualVolumesOfContainer(context(), goldId, 10)));
    EXPECT_EQ(get(client_->queryVirtualVolumesById(context(), goldId, {webId, noVolume, webId})),
              get(embedded_->queryVirtualVolumesById(context(), goldId, {webId, noVolume, webId})));
    EXPECT_EQ(get(client_->queryVirtualVolumesBound(context())), get(embedded_->queryVirtualVolumesBound(context())));
    EXPECT_EQ(get(client_->queryVirtualVolumeByDirectoryName(context(), goldId, "web")),
              get(embedded_->queryVirtualVolumeByDirectoryName(context(), goldId, "web")));
    EXPECT_EQ(get(client_->queryVirtualVolumeByDirectoryName(context(), goldId, "nothing")), std::nullopt);
}

TEST_F(HttpsOperationTest, refusesInTheArraysOwnWordsAndCodes) {
    VolumeSpec taken;
    taken.containerId = goldId;
    taken.directoryName = "web";
    VolumeSpec large = taken;
    large.directoryName = "large";
    large.sizeMb = 1 << 30;
    auto const both = [&](auto const &ask) {
        auto const here = ask(*client_);
        auto const code = code_;
        EXPECT_EQ(here, ask(*embedded_));
        EXPECT_EQ(code, code_);
        EXPECT_NE(code, ErrorCode::Success);
    };
    both([&](auto &provider) { return sentence(provider.createVirtualVolume(context(), taken)); });
    both([&](auto &provider) { return sentence(provider.createVirtualVolume(context(), large)); });
    both([&](auto &provider) { return sentence(provider.queryVirtualVolume(context(), goldId, noVolume)); });
    both([&](auto &provider) { return sentence(provider.queryVirtualVolume(context(), noContainer, webId)); });
    both([&](auto &provider) { return sentence(provider.deleteVirtualVolume(context(), goldId, dataId)); });
    both([&](auto &provider) { return sentence(provider.bindVirtualVolume(context(), goldId, webId, "no such")); });
}

TEST_F(HttpsOperationTest, namesProviderAndPathWhenTheWayIsWrong) {
    serve();
    EXPECT_EQ(
        sentence(newClient("https://array.test:8443/elsewhere")->queryStorageArray(context())),
        "the provider at array.test:8443 does not serve /elsewhere/v1/queryStorageArray: there is nothing at this "
        "path; operations are at /orka/v1/");
    serveText(404, R"({"error": {"code": "unknownOperation", "message": "not yet"}})");
    EXPECT_EQ(sentence(newClient()->setContext(context("k"))),
              "the provider at array.test:8443 does not serve /orka/v1/setContext: not yet");
    EXPECT_EQ(code_, Wire::ErrorCode::UnknownOperation);
}

TEST_F(HttpsOperationTest, changesWhatTheArrayHolds) {
    VolumeSpec spec;
    spec.containerId = goldId;
    spec.directoryName = "sch\xc3\xb6n \"quoted\"\n";
    spec.sizeMb = 512;
    spec.profile = "a=b";
    auto const made = get(client_->createVirtualVolume(context("one"), spec));
    EXPECT_EQ(get(client_->createVirtualVolume(context("one"), spec)), made);
    EXPECT_EQ(get(embedded_->queryVirtualVolume(context(), goldId, made.uuid)), made);
    get(client_->bindVirtualVolume(context("two"), goldId, made.uuid, "pe-1"));
    EXPECT_EQ(get(embedded_->queryVirtualVolume(context(), goldId, made.uuid)).boundTo, "pe-1");
    get(client_->unbindVirtualVolume(context("three"), goldId, made.uuid));
    get(client_->deleteVirtualVolume(context("four"), goldId, made.uuid));
    EXPECT_EQ(get(embedded_->queryVirtualVolumesById(context(), goldId, {made.uuid}))[0].exists, false);
    auto speaking = context();
    speaking.orkaContext = "rack \x01 7";
    get(client_->setContext(speaking));
    EXPECT_EQ(Orka::ArrayFile(at("test.array")).hostContext(), "rack \x01 7");
    get(client_->setContext(context()));
    EXPECT_EQ(Orka::ArrayFile(at("test.array")).hostContext(), std::nullopt);
}

TEST_F(HttpsOperationTest, goesOverOneConnectionUntilItHasBeenIdle) {
    for (int count = 0; count < 5; ++count) {
        get(client_->queryVirtualVolume(context(), goldId, webId));
    }
    EXPECT_EQ(network_.connections, 1);
    timer_.advanceTo(timer_.now() + 5 * kj::SECONDS);
    get(client_->queryVirtualVolume(context(), goldId, webId));
    EXPECT_EQ(network_.connections, 2);
}

TEST_F(HttpsOperationTest, goesOnWhenTheServerClosedTheConnectionMeanwhile) {
    get(client_->queryVirtualVolume(context(), goldId, webId));
    serving_.clear();
    get(client_->queryVirtualVolume(context(), goldId, webId));
    EXPECT_EQ(took_, 0 * kj::SECONDS);
    EXPECT_EQ(network_.connections, 2);
}

TEST_F(HttpsOperationTest, asksForAListAnewOnlyWhenItHasChanged) {
    auto const first = get(client_->queryStorageContainer(context()));
    auto const second = get(client_->queryStorageContainer(context()));
    EXPECT_EQ(second.items, first.items);
    EXPECT_EQ(second.version, first.version);
    EXPECT_EQ(get(client_->queryStorageArray(context())).version, first.version);
    Stranger(at("test.array")).execute("UPDATE container SET name = 'platinum' WHERE name = 'gold'");
    auto const third = get(client_->queryStorageContainer(context()));
    EXPECT_NE(third.version, first.version);
    EXPECT_EQ(third.items->front().name, "platinum");
    EXPECT_EQ(first.items->front().name, "gold");
    EXPECT_EQ(get(client_->queryStorageArray(context())).version, third.version);
}

void HttpsOperationTest::makeManyVolumes() {
    Stranger(at("test.array"))
        .execute(
            "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 2500) "
            "INSERT INTO volume (uuid, container, kind, directory_name, size_mb, committed_mb, block_size, vm_uuid) "
            "SELECT printf('30000000-0000-4000-8000-%012d', i), (SELECT seq FROM container WHERE name = 'gold'), 0, "
            "'d' || i, 1, 0, 4096, '' FROM n");
}

TEST_F(HttpsOperationTest, readsListsOfManyPages) {
    makeManyVolumes();
    auto const all = get(client_->queryVirtualVolumesOfContainer(context(), goldId, 1 << 20));
    EXPECT_EQ(all, get(embedded_->queryVirtualVolumesOfContainer(context(), goldId, 1 << 20)));
    EXPECT_EQ(requests_, 3);
    EXPECT_EQ(get(client_->queryVirtualVolumesOfContainer(context(), goldId, 1500)),
              get(embedded_->queryVirtualVolumesOfContainer(context(), goldId, 1500)));
    std::vector<std::string> ids;
    for (auto const &volume : all) {
        ids.push_back(volume.uuid);
    }
    EXPECT_EQ(get(client_->queryVirtualVolumesById(context(), goldId, ids)).size(), ids.size());
    EXPECT_TRUE(get(client_->queryVirtualVolumesById(context(), goldId, {})).empty());
}

TEST_F(HttpsOperationTest, readsLongListsForAWholeFleetAtOnce) {
    makeManyVolumes();
    constexpr int hosts = 40;
    constexpr int listsPerHost = 5;
    std::vector<std::unique_ptr<Orka::Provider>> clients;
    kj::Vector<kj::Promise<Orka::Outcome<std::vector<Orka::ConfigVolume>>>> wanted;
    for (int host = 0; host < hosts; ++host) {
        clients.push_back(newClient());
        for (int list = 0; list < listsPerHost; ++list) {
            wanted.add(
                clients.back()->queryVirtualVolumesOfContainer(context(), goldId, 1 << 20).eagerlyEvaluate(nullptr));
        }
    }
    auto const expected = get(embedded_->queryVirtualVolumesOfContainer(context(), goldId, 1 << 20));
    for (auto &promise : wanted) {
        EXPECT_EQ(get(kj::mv(promise)), expected);
    }
    EXPECT_EQ(requests_, hosts * listsPerHost * 3) << "no list was begun anew";
}

TEST_F(HttpsOperationTest, losesNoUpdateOfManyHosts) {
    constexpr int hosts = 20;
    kj::Vector<kj::Promise<Orka::Outcome<Orka::VirtualVolume>>> wanted;
    std::vector<std::unique_ptr<Orka::Provider>> clients;
    VolumeSpec same;
    same.containerId = goldId;
    same.directoryName = "wanted by all";
    for (int host = 0; host < hosts; ++host) {
        clients.push_back(newClient());
        VolumeSpec own = same;
        own.directoryName = "of host " + std::to_string(host);
        wanted.add(clients.back()->createVirtualVolume(context("same " + std::to_string(host)), same));
        wanted.add(clients.back()->createVirtualVolume(context("own " + std::to_string(host)), own));
    }
    int made = 0;
    int refused = 0;
    for (auto &promise : wanted) {
        auto const result = outcome(kj::mv(promise));
        made += result.ok();
        refused += !result.ok() && result.failure().code() == ErrorCode::AlreadyExists;
    }
    EXPECT_EQ(made, hosts + 1);
    EXPECT_EQ(refused, hosts - 1);
    EXPECT_EQ(Orka::ArrayFile(at("test.array")).counts().configVolumes, 2 + hosts + 1);
}

TEST_F(HttpsOperationTest, answersWhatAPromiseAskedThoughTheProviderIsGone) {
    auto promise = client_->queryVirtualVolume(context(), goldId, webId);
    client_.reset();
    EXPECT_EQ(get(kj::mv(promise)).uuid, webId);
}

TEST_F(HttpsOperationTest, isNotAskedAfterItsDeadline) {
    EXPECT_EQ(sentence(client_->queryStorageArray(context("", 0 * kj::SECONDS))),
              "the deadline had passed before the provider at array.test:8443 could be asked");
    EXPECT_EQ(network_.connections, 0);
}

TEST_F(HttpsOperationTest, refusesUrlsThatItCannotUse) {
    struct Url {
        char const *url;
        char const *why;
    };
    for (auto const &[address, why] : {
             Url{"https://", "it names no host, as https://host:port/path does"},
             Url{"https:///orka", "it names no host, as https://host:port/path does"},
             Url{"https://user@host/", "it may not name a user"},
             Url{"https://host/orka?x", "it may hold neither '?' nor '#'"},
             Url{"https://host:0/", "its port is no number from 1 to 65535"},
             Url{"https://host:65536/", "its port is no number from 1 to 65535"},
             Url{"https://host:/", "its port is no number from 1 to 65535"},
             Url{"https://ho st/", "its host is no name and no address"},
             Url{"https://[::1/", "the ']' that ends its address is missing"},
             Url{"https://[x]/", "between its brackets stands no address"},
             Url{"https://host/a b", "its path holds a character that has to be written as %XX"},
             Url{"http://host/", "providers are reached by file:///path/name.array or https://host:port/path"},
         }) {
        EXPECT_EQ(failureOf([&, &a = address] { newClient(a); }),
                  std::string("the provider URL '") + address + "' cannot be used: " + why);
        EXPECT_EQ(codeOf([&, &a = address] { newClient(a); }), ErrorCode::InvalidArgument);
    }
}

TEST_F(HttpsOperationTest, asksAtTheHostAndPortOfTheUrl) {
    EXPECT_NE(sentence(newClient("HTTPS://array.test")->queryStorageArray(context())), "");
    EXPECT_EQ(network_.lastAddress, "array.test:443");
    EXPECT_NE(sentence(newClient("https://[::1]:70/x/")->queryStorageArray(context())), "");
    EXPECT_EQ(network_.lastAddress, "[::1]:70");
}

} // namespace
