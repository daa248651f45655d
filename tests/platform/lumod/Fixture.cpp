// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

#include <cstdlib>
#include <filesystem>
#include <system_error>

#include <fmt/format.h>

namespace LumodTest {

TempDirectory::TempDirectory() {
    std::string path = (std::filesystem::temp_directory_path() / "lumod-test-XXXXXX").string();
    if (::mkdtemp(path.data()) == nullptr) {
        throw std::system_error(errno, std::generic_category(), path);
    }
    path_ = path;
}

TempDirectory::~TempDirectory() {
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
}

std::string containerIdOf(int number) {
    return fmt::format("{:08x}-0000-4000-8000-000000000000", number);
}

Orka::StorageArray arrayOf(std::string const &id, std::vector<std::string> const &endpoints) {
    Orka::StorageArray array;
    array.id = id;
    array.name = "name of " + id;
    array.vendorId = "vendor";
    array.modelId = "model";
    for (std::string const &uid : endpoints) {
        Orka::Endpoint endpoint;
        endpoint.uid = uid;
        endpoint.text1 = "lun " + uid;
        endpoint.isAccessible = true;
        endpoint.isConfigured = true;
        array.endpoints.push_back(endpoint);
    }
    return array;
}

Orka::StorageContainer containerOf(int number, std::string const &name, std::vector<std::string> const &arrayIds) {
    return {containerIdOf(number), name, 1 << 20, arrayIds};
}

DaemonFixture::DaemonFixture() {
    Lumod::Settings settings;
    settings.root = root_.path();
    settings.version = "1.2.3";
    auto const makeProvider = [this](std::string const &url) -> std::unique_ptr<Orka::Provider> {
        auto const vendor = vendors_.find(url);
        if (vendor == vendors_.end()) {
            throw Wire::Failure(Wire::ErrorCode::InvalidArgument, "no provider speaks " + url);
        }
        return std::make_unique<FakeProvider>(vendor->second);
    };
    daemon_ = std::make_unique<Lumod::Daemon>(
        settings, Lumod::Surroundings{timer_, log_, makeProvider, [this] { return fmt::format("key-{}", ++keys_); }});
}

DaemonFixture::~DaemonFixture() noexcept = default;

std::shared_ptr<FakeVendor> DaemonFixture::addVendor(std::string const &name,
                                                     std::vector<Store::ProviderArray> arrays) {
    auto vendor = std::make_shared<FakeVendor>();
    vendors_["fake:" + name] = vendor;
    store_.putProviders({{name, "fake:" + name, {}, std::move(arrays)}});
    return vendor;
}

std::shared_ptr<FakeVendor> DaemonFixture::addUsualVendor() {
    auto vendor = addVendor("vp");
    vendor->arrays = {arrayOf("a1", {"e1", "e2"})};
    vendor->containers = {containerOf(1, "gold", {"a1"})};
    return vendor;
}

Pending DaemonFixture::start(Fill const &fill, bool ordered, std::string const &trace) {
    auto request = std::make_unique<capnp::MallocMessageBuilder>();
    auto root = request->initRoot<Wire::Request>();
    root.setVersion(Wire::PROTOCOL_VERSION);
    fill(root);
    auto const call = std::make_shared<Lumod::Call const>(Lumod::Call{trace, timer_.now() + 30 * kj::SECONDS, ordered});
    auto dispatched = Lumod::dispatch(daemon_->core(), call, root.asReader());
    auto *const outcome = std::get_if<Lumod::Outcome<Lumod::ReplyPtr>>(&dispatched);
    return {std::move(request), outcome != nullptr ? Lumod::Answer<Lumod::ReplyPtr>(std::move(*outcome))
                                                   : std::get<Lumod::Answer<Lumod::ReplyPtr>>(std::move(dispatched))};
}

Reply DaemonFixture::finish(Pending pending) {
    Reply reply;
    if (!pending.promise.poll(scope_)) {
        ADD_FAILURE() << "the request has not been answered";
        reply.failure = Wire::Failure(Wire::ErrorCode::DeadlineExceeded, "still pending");
        return reply;
    }
    Lumod::Outcome<Lumod::ReplyPtr> outcome = pending.promise.wait(scope_);
    if (!outcome.ok()) {
        reply.failure = outcome.failure();
        return reply;
    }
    Lumod::ReplyPtr const source = std::move(outcome).value();
    bool more = true;
    while (more) {
        reply.messages.push_back(std::make_unique<capnp::MallocMessageBuilder>());
        more = source->next(reply.messages.back()->initRoot<Wire::Reply>());
    }
    return reply;
}

void DaemonFixture::advance(kj::Duration duration) {
    timer_.advanceTo(timer_.now() + duration);
    scope_.poll();
}

std::vector<std::string> DaemonFixture::containers() {
    Reply const reply = ask([](Wire::Request::Builder request) { request.setGetStorageContainer(); });
    EXPECT_EQ(reply.sentence(), "");
    return containersIn(reply);
}

std::vector<std::string> DaemonFixture::containersIn(Reply const &reply) {
    std::vector<std::string> arrays;
    std::vector<std::string> texts;
    for (std::size_t index = 0; index < reply.messages.size(); ++index) {
        Wire::Reply::Reader const message = reply.at(index);
        if (message.isStorageArrays()) {
            for (Wire::StorageArray::Reader const array : message.getStorageArrays()) {
                arrays.emplace_back(array.getId().cStr());
            }
            continue;
        }
        for (Wire::StorageContainer::Reader const container : message.getStorageContainers()) {
            std::string list;
            for (uint32_t const place : container.getArrays()) {
                list += (list.empty() ? "" : ",") + arrays.at(place);
            }
            texts.push_back(
                fmt::format("{}@{}[{}]", container.getName().cStr(), container.getProviderUrl().cStr(), list));
        }
    }
    return texts;
}

Reply DaemonFixture::inject(std::string const &name, std::string const &status,
                            std::vector<std::pair<std::string, bool>> const &arrays) {
    return ask([&](Wire::Request::Builder request) {
        auto injection = request.initVendorProviderInjectFault();
        injection.setProviderName(name.c_str());
        injection.setProviderUrl(("fake:" + name).c_str());
        injection.setStatus(status.c_str());
        auto list = injection.initArrays(static_cast<unsigned>(arrays.size()));
        for (unsigned place = 0; place < list.size(); ++place) {
            list[place].setArrayId(arrays[place].first.c_str());
            list[place].setIsActive(arrays[place].second);
        }
    });
}

Fill DaemonFixture::volumeFill(char const *method, std::string const &uuid, std::string const &directoryName) {
    return [method = std::string(method), uuid, directoryName](Wire::Request::Builder request) {
        auto key = method == "bind"       ? request.initBindVirtualVolume()
                   : method == "unbind"   ? request.initUnbindVirtualVolume()
                   : method == "delete"   ? request.initDeleteVirtualVolume()
                   : method == "space"    ? request.initSpaceStatsForLumo()
                   : method == "info"     ? request.initGetLumoInfo()
                   : method == "unshared" ? request.initUnsharedChunksLumo()
                                          : request.initGetLumoMetadata();
        key.setContainerId(containerIdOf(1).c_str());
        key.setUuid(uuid.c_str());
        key.setDirectoryName(directoryName.c_str());
    };
}

Reply DaemonFixture::volumeRequest(char const *method, std::string const &uuid, std::string const &directoryName,
                                   bool ordered) {
    return ask(volumeFill(method, uuid, directoryName), ordered);
}

std::vector<int> DaemonFixture::accessibility(std::vector<std::string> const &ids, int container) {
    Reply const reply = ask([&](Wire::Request::Builder request) {
        auto check = request.initCheckLumoAccessibility();
        check.setContainerId(containerIdOf(container).c_str());
        auto list = check.initLumoIds(static_cast<unsigned>(ids.size()));
        for (unsigned place = 0; place < list.size(); ++place) {
            list.set(place, ids[place].c_str());
        }
    });
    EXPECT_EQ(reply.sentence(), "");
    std::vector<int> levels;
    if (!reply.failure) {
        for (kj::byte const level : reply.only().getAccessibility()) {
            levels.push_back(level);
        }
    }
    return levels;
}

} // namespace LumodTest
