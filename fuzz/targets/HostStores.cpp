// SPDX-License-Identifier: Apache-2.0
//
// A host store that is damaged or was meddled with (DatabaseInput.h tells what an input is), opened as the daemon and
// as the tool do: each operation fails with a declared failure or does what it says, and the two read the same.
#include <functional>
#include <optional>
#include <string>

#include "DatabaseInput.h"
#include "Property.h"
#include "SampleStore.h"
#include "Scratch.h"
#include "store/HostStore.h"

namespace {

using Fuzz::require;
using namespace Store;

constexpr char const *container = Fuzz::sampleContainer;
constexpr char const *uuid = Fuzz::sampleVolume;

struct Sample {
    Fuzz::ScratchDirectory directory;
    std::string path = Fuzz::makeSampleStore(directory.path());
    std::string bytes = Fuzz::smallest(path);
};

void attempt(std::function<void()> const &operation) {
    try {
        operation();
    } catch (Wire::Failure const &failure) {
        Fuzz::requireFailure(failure);
    }
}

template <typename Read>
auto readBy(HostStore &store, Read read) -> std::optional<decltype(read(store))> {
    try {
        return read(store);
    } catch (Wire::Failure const &failure) {
        Fuzz::requireFailure(failure);
        return std::nullopt;
    }
}

void readBoth(HostStore &tool, HostStore &daemon) {
    auto const same = [&](char const *what, auto read) {
        require(readBy(tool, read) == readBy(daemon, read), "tool and daemon read the same", what);
    };
    same("providers", [](HostStore &store) { return store.providers(); });
    same("file systems", [](HostStore &store) { return store.fileSystems(); });
    same("volumes", [](HostStore &store) { return store.volumes(); });
    same("mounts", [](HostStore &store) { return store.mounts(); });
    same("outages", [](HostStore &store) { return store.endpointOutages(); });
    same("context", [](HostStore &store) { return store.orkaContext(); });
    same("one provider", [](HostStore &store) { return store.provider("provider"); });
    same("one file system", [](HostStore &store) { return store.fileSystem(container); });
    same("one by name", [](HostStore &store) { return store.fileSystemNamed("gold"); });
    same("one volume", [](HostStore &store) { return store.volume(uuid); });
    same("a mounted one", [](HostStore &store) { return store.mountedVolume(container, "directory"); });
    same("unmounted ones", [](HostStore &store) { return store.unmountedVolumes(container, "away"); });
    same("unsettled ones", [](HostStore &store) { return store.unsettledVolumes(); });
    attempt([&] {
        for (Volume const &volume : tool.volumes()) {
            require(volume.state >= VolumeState::Mounted && volume.state <= VolumeState::Removing,
                    "a volume is in one of the states", volume.uuid);
        }
    });
    attempt([&] { tool.checkIntegrity(); });
    attempt([&] { daemon.dataVersion(); });
}

void change(HostStore &tool) {
    Provider const provider{"new", "file:///b.array", "", {{"array", true, 0}}};
    attempt([&] {
        tool.putProviders({provider});
        require(tool.provider("new") == provider, "what was put is there");
    });
    attempt([&] {
        tool.putVolumes({{uuid, container, "directory", VolumeState::Unmounting}}, {});
        HostStore::Change change(tool);
        tool.putVolumes({}, {{uuid, container, "directory", VolumeState::Unmounting}});
        change.commit();
    });
    attempt([&] { tool.setEndpointOutage("endpoint", false); });
    attempt([&] { tool.setOrkaContext("another"); });
    attempt([&] { tool.clearOrkaContext(); });
    attempt([&] { tool.removeFileSystem(container); });
    attempt([&] { tool.removeProvider("provider"); });
}

} // namespace

int LLVMFuzzerTestOneInput(std::uint8_t const *data, std::size_t size) {
    static Sample const sample;
    Fuzz::putDatabase(sample.path, sample.bytes, Fuzz::textOf(data, size));
    HostStore tool(sample.directory.path(), HostStore::Mode::ReadWrite, std::chrono::milliseconds(0));
    HostStore daemon(sample.directory.path(), HostStore::Mode::QueryOnly, std::chrono::milliseconds(0));
    readBoth(tool, daemon);
    change(tool);
    return 0;
}
