// SPDX-License-Identifier: Apache-2.0
#include "lumolib/Client.h"

#include <functional>

#include "FakeDaemon.h"
#include "Host.h"
#include "wire/Limits.h"

namespace LumoTest {

using LumoClient::Channel;
using LumoClient::Settings;
using Wire::ErrorCode;

class Client : public Host {
protected:
    LumoClient::Client client() const {
        return LumoClient::Client(Settings::fromEnvironment());
    }
    std::unique_ptr<FakeDaemon> serve(FakeDaemon::Handler handler) {
        return std::make_unique<FakeDaemon>(socket(), std::move(handler));
    }
};

std::string failureOf(std::function<void()> const &work) {
    try {
        work();
        return "none";
    } catch (Wire::Failure const &failure) {
        return std::to_string(static_cast<int>(failure.code())) + ": " + failure.sentence();
    }
}

/// Answers with a volume whose directory tells which method was asked.
void answerVolume(Wire::Request::Reader request, Peer &peer) {
    peer.reply(request.getId(), [&](Wire::Reply::Builder reply) {
        Wire::Volume::Builder volume = reply.initVolume();
        volume.setUuid("v1");
        volume.setDirectoryName("vm");
        volume.setEndpoint(request.isBindVirtualVolume() ? "pe0" : "");
    });
}

TEST_F(Client, takes_its_settings_from_the_environment) {
    set("TOVI_TIMEOUT_MS", "1500");
    set("TOVI_REQUEST_ID", "command-3");
    Settings settings = Settings::fromEnvironment();
    EXPECT_EQ(settings.root, paths().root());
    EXPECT_EQ(settings.timeout.count(), 1500);
    EXPECT_EQ(settings.requestId, "command-3");
    EXPECT_FALSE(settings.offline);
    set("TOVI_OFFLINE", "1");
    EXPECT_TRUE(Settings::fromEnvironment().offline);
    set("TOVI_OFFLINE", "");
    EXPECT_FALSE(Settings::fromEnvironment().offline);
}

TEST_F(Client, connects_only_when_it_is_asked_something) {
    LumoClient::Client lazy(Settings::fromEnvironment());
    EXPECT_EQ(failureOf([&] { lazy.ping(); }), "10: no daemon answers at " + socket() + ": No such file or directory");
    auto const daemon = serve([](Wire::Request::Reader request, Peer &peer) {
        peer.reply(request.getId(), [](Wire::Reply::Builder reply) {
            Wire::Pong::Builder pong = reply.initPong();
            pong.setVersion("1.0.0");
            pong.setPid(42);
            pong.setUptimeMs(5000);
            pong.setRoot("/r");
        });
    });
    LumoClient::DaemonStatus const status = lazy.ping();
    EXPECT_EQ(status.version, "1.0.0");
    EXPECT_EQ(status.pid, 42U);
    EXPECT_EQ(status.uptime.count(), 5000);
    EXPECT_EQ(status.root, "/r");
    EXPECT_EQ(lastFailure(), "none") << "noting is for the one who answers a command";
}

TEST_F(Client, offline_connects_nowhere) {
    set("TOVI_OFFLINE", "1");
    auto const daemon = serve(answerVolume);
    LumoClient::Client offline(Settings::fromEnvironment());
    EXPECT_EQ(failureOf([&] {
                  offline.bindVirtualVolume({"c", "v", ""}, Channel::Ordered);
              }),
              "10: no daemon answers at " + socket());
    EXPECT_EQ(failureOf([&] {
                  offline.bindVirtualVolume({"c", "v", ""}, Channel::Priority);
              }),
              "10: no daemon answers at " + paths().prioritySocket());
    EXPECT_EQ(daemon->connections(), 0);
}

TEST_F(Client, changes_volumes) {
    auto const daemon = serve(answerVolume);
    LumoClient::Client client(Settings::fromEnvironment());
    LumoClient::Volume const made = client.createVirtualVolume({"c", "vm", "gold", 4096, "vm-uuid"}, Channel::Ordered);
    EXPECT_EQ(made.uuid, "v1");
    EXPECT_EQ(made.directoryName, "vm");
    EXPECT_EQ(made.endpoint, "");
    EXPECT_EQ(client.bindVirtualVolume({"c", "v1", ""}, Channel::Ordered).endpoint, "pe0");
    EXPECT_EQ(client.unbindVirtualVolume({"c", "", "vm"}, Channel::Ordered).uuid, "v1");
    EXPECT_EQ(client.deleteVirtualVolume({"c", "v1", ""}, Channel::Ordered).uuid, "v1");
    std::vector<std::string> const expected = {
        R"((traceId = "", createVirtualVolume = (containerId = "c", directoryName = "vm", policy = "gold", )"
        R"(sizeMb = 4096, vmUuid = "vm-uuid")))",
        R"((traceId = "", bindVirtualVolume = (containerId = "c", uuid = "v1", directoryName = "")))",
        R"((traceId = "", unbindVirtualVolume = (containerId = "c", uuid = "", directoryName = "vm")))",
        R"((traceId = "", deleteVirtualVolume = (containerId = "c", uuid = "v1", directoryName = "")))",
    };
    EXPECT_EQ(daemon->asked(), expected);
    EXPECT_EQ(daemon->connections(), 1);
}

TEST_F(Client, uses_the_second_socket_for_what_has_priority) {
    auto const ordered = serve(answerVolume);
    FakeDaemon const priority(paths().prioritySocket(), answerVolume);
    LumoClient::Client client(Settings::fromEnvironment());
    client.bindVirtualVolume({"c", "v1", ""}, Channel::Priority);
    client.createVirtualVolume({"c", "vm", "", 0, ""}, Channel::Priority);
    client.unbindVirtualVolume({"c", "v1", ""}, Channel::Priority);
    client.deleteVirtualVolume({"c", "v1", ""}, Channel::Priority);
    EXPECT_EQ(priority.asked().size(), 4U);
    EXPECT_EQ(ordered->connections(), 0);
}

TEST_F(Client, hears_a_failure_as_the_daemon_put_it) {
    auto const daemon = serve([](Wire::Request::Reader request, Peer &peer) {
        peer.failure(request.getId(), code(ErrorCode::AlreadyExists), "a config volume vm exists in container c");
    });
    LumoClient::Client client(Settings::fromEnvironment());
    EXPECT_EQ(failureOf([&] {
                  client.createVirtualVolume({"c", "vm", "", 0, ""}, Channel::Ordered);
              }),
              "26: a config volume vm exists in container c");
}

TEST_F(Client, does_not_repeat_a_change_that_the_daemon_may_have_seen) {
    auto const daemon = serve([](Wire::Request::Reader, Peer &peer) { peer.hangUp(); });
    LumoClient::Client client(Settings::fromEnvironment());
    EXPECT_EQ(failureOf([&] {
                  client.deleteVirtualVolume({"c", "v", ""}, Channel::Ordered);
              }),
              "11: the daemon at " + socket() +
                  " closed the connection before it answered; the change may have been carried out");
    EXPECT_EQ(daemon->asked().size(), 1U);
}

TEST_F(Client, finds_a_container_with_the_arrays_that_hold_it) {
    auto const daemon = serve([](Wire::Request::Reader request, Peer &peer) {
        peer.reply(
            request.getId(),
            [](Wire::Reply::Builder reply) {
                capnp::List<Wire::StorageArray>::Builder arrays = reply.initStorageArrays(2);
                arrays[0].setId("a0");
                arrays[1].setId("a1");
            },
            false);
        peer.reply(request.getId(), [](Wire::Reply::Builder reply) {
            Wire::StorageContainer::Builder container = reply.initStorageContainers(1)[0];
            container.setId("c");
            container.setName("gold");
            container.setProviderUrl("https://vp");
            container.setMaxLumoSizeMb(2048);
            container.initArrays(1).set(0, 1);
        });
    });
    LumoClient::Client client(Settings::fromEnvironment());
    LumoClient::Container const container = client.findStorageContainer("c", {"a1"});
    EXPECT_EQ(container.id, "c");
    EXPECT_EQ(container.name, "gold");
    EXPECT_EQ(container.providerUrl, "https://vp");
    EXPECT_EQ(container.maxLumoSizeMb, 2048);
    EXPECT_EQ(container.arrayIds, std::vector<std::string>{"a1"});
    EXPECT_EQ(daemon->asked().at(0),
              R"((traceId = "", findStorageContainer = (containerId = "c", arrayIds = ["a1"])))");
}

TEST_F(Client, fault_24_finds_no_container_in_an_answer_without_one_or_with_two) {
    unsigned count = 0;
    auto const daemon = serve([&count](Wire::Request::Reader request, Peer &peer) {
        peer.reply(request.getId(), [&](Wire::Reply::Builder reply) { reply.initStorageContainers(count); });
    });
    LumoClient::Client client(Settings::fromEnvironment());
    EXPECT_EQ(failureOf([&] { client.findStorageContainer("c", {}); }),
              "23: no provider exports the storage container c");
    count = 2;
    EXPECT_EQ(failureOf([&] { client.findStorageContainer("c", {}); }),
              "5: the daemon at " + socket() + " broke the protocol: it answered several containers of one id");
}

using Told = std::vector<std::pair<std::string, std::vector<std::string>>>;

Told visited(LumoClient::Client &client) {
    Told told;
    client.visitStorageContainers(
        [&told](std::string_view id, std::vector<std::string> const &arrayIds) { told.emplace_back(id, arrayIds); });
    return told;
}

TEST_F(Client, visits_the_containers_of_all_chunks_in_order) {
    auto const daemon = serve([](Wire::Request::Reader request, Peer &peer) {
        peer.reply(
            request.getId(),
            [](Wire::Reply::Builder reply) {
                auto arrays = reply.initStorageArrays(2);
                arrays[0].setId("a0");
                arrays[1].setId("a1");
            },
            false);
        peer.reply(
            request.getId(),
            [](Wire::Reply::Builder reply) {
                auto containers = reply.initStorageContainers(2);
                containers[0].setId("c0");
                containers[0].initArrays(2).set(0, 1);
                containers[1].setId("c1");
            },
            false);
        peer.reply(request.getId(), [](Wire::Reply::Builder reply) {
            auto containers = reply.initStorageContainers(1);
            containers[0].setId("c2");
            containers[0].initArrays(1).set(0, 1);
        });
    });
    LumoClient::Client client(Settings::fromEnvironment());
    EXPECT_EQ(visited(client), (Told{{"c0", {"a1", "a0"}}, {"c1", {}}, {"c2", {"a1"}}}));
    EXPECT_EQ(daemon->asked().at(0), R"((traceId = "", getStorageContainer = void))");
}

TEST_F(Client, visits_nothing_where_no_provider_exports_anything) {
    auto const daemon = serve(answerDone);
    LumoClient::Client client(Settings::fromEnvironment());
    EXPECT_EQ(visited(client), Told());
}

TEST_F(Client, fault_24_refuses_containers_that_make_no_sense) {
    std::function<void(Wire::Reply::Builder)> fill;
    auto const daemon =
        serve([&fill](Wire::Request::Reader request, Peer &peer) { peer.reply(request.getId(), fill); });
    LumoClient::Client client(Settings::fromEnvironment());
    auto const broke = [this](std::string const &what) {
        return "5: the daemon at " + socket() + " broke the protocol: " + what;
    };
    fill = [](Wire::Reply::Builder reply) { reply.initStorageContainers(1)[0].initArrays(1).set(0, 3); };
    EXPECT_EQ(failureOf([&] { visited(client); }), broke("a container names array 3 of 0"));
    fill = [](Wire::Reply::Builder reply) { reply.initPong(); };
    EXPECT_EQ(failureOf([&] { visited(client); }), broke("it answered something else than storage containers"));
    fill = [](Wire::Reply::Builder reply) { reply.initStorageContainers(1001); };
    EXPECT_NE(failureOf([&] { visited(client); }).find("broke the protocol"), std::string::npos);
}

TEST_F(Client, tells_the_containers_of_an_endpoint) {
    auto const daemon = serve([](Wire::Request::Reader request, Peer &peer) {
        peer.reply(request.getId(), [](Wire::Reply::Builder reply) {
            capnp::List<capnp::Text>::Builder names = reply.initContainerNames(2);
            names.set(0, "gold");
            names.set(1, "silver");
        });
    });
    LumoClient::Client client(Settings::fromEnvironment());
    EXPECT_EQ(client.protocolEndpointEvent("pe0", true), (std::vector<std::string>{"gold", "silver"}));
    EXPECT_EQ(daemon->asked().at(0), R"((traceId = "", protocolEndpointEvent = (endpoint = "pe0", apd = true)))");
}

/// Answers for each id its length modulo 4.
void answerAccessibility(Wire::Request::Reader request, Peer &peer) {
    peer.reply(request.getId(), [&](Wire::Reply::Builder reply) {
        capnp::List<capnp::Text>::Reader const ids = request.getCheckLumoAccessibility().getLumoIds();
        capnp::Data::Builder values = reply.initAccessibility(ids.size());
        for (unsigned place = 0; place < ids.size(); ++place) {
            values[place] = static_cast<kj::byte>(ids[place].size() % 4);
        }
    });
}

TEST_F(Client, checks_many_volumes_in_few_requests) {
    auto const daemon = serve(answerAccessibility);
    LumoClient::Client client(Settings::fromEnvironment());
    std::vector<std::string> ids;
    for (std::size_t place = 0; place < 25000; ++place) {
        ids.push_back(std::string(30 + place % 5, 'x'));
    }
    std::vector<std::uint8_t> const values = client.checkLumoAccessibility("c", ids);
    ASSERT_EQ(values.size(), ids.size());
    for (std::size_t place = 0; place < ids.size(); ++place) {
        ASSERT_EQ(values[place], ids[place].size() % 4) << place;
    }
    EXPECT_EQ(daemon->asked().size(), 3U);
}

TEST_F(Client, checks_volumes_of_long_names_within_the_limit_of_a_request) {
    auto const daemon = serve(answerAccessibility);
    LumoClient::Client client(Settings::fromEnvironment());
    std::vector<std::string> const ids(30, std::string(100000, 'x'));
    EXPECT_EQ(client.checkLumoAccessibility("c", ids).size(), ids.size());
    EXPECT_EQ(daemon->asked().size(), 3U);
}

TEST_F(Client, asks_nothing_about_no_volumes) {
    LumoClient::Client client(Settings::fromEnvironment());
    EXPECT_TRUE(client.checkLumoAccessibility("c", {}).empty());
}

TEST_F(Client, fault_24_refuses_accessibilities_that_do_not_fit_the_question) {
    std::string answer;
    auto const daemon = serve([&answer](Wire::Request::Reader request, Peer &peer) {
        peer.reply(request.getId(), [&](Wire::Reply::Builder reply) {
            reply.setAccessibility(kj::arrayPtr(reinterpret_cast<kj::byte const *>(answer.data()), answer.size()));
        });
    });
    LumoClient::Client client(Settings::fromEnvironment());
    std::string const broke = "5: the daemon at " + socket() + " broke the protocol: ";
    answer = "\1";
    EXPECT_EQ(failureOf([&] {
                  client.checkLumoAccessibility("c", {"a", "b"});
              }),
              broke + "it answered the accessibility of 1 volumes instead of 2");
    answer = "\1\1\1";
    EXPECT_EQ(failureOf([&] {
                  client.checkLumoAccessibility("c", {"a", "b"});
              }),
              broke + "it answered the accessibility of more volumes than were asked about");
    answer = "\1\4";
    EXPECT_EQ(failureOf([&] {
                  client.checkLumoAccessibility("c", {"a", "b"});
              }),
              broke + "it answered the accessibility 4");
}

} // namespace LumoTest
