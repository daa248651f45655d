// SPDX-License-Identifier: Apache-2.0
#include "completion/ValueSource.h"

#include <utility>

#include "plexa/Formatter.h"

namespace Tovicli::Cli {

using namespace Plexa;

namespace {

using Kind = ValueSource::Kind;
using Words = std::vector<std::string>;

ValueSource words(Words list) {
    return {Kind::Words, std::move(list)};
}

ValueSource live(Live which) {
    return {Kind::Live, {}, which};
}

/// "simple, table, json" in parts.
Words formats() {
    Words names;
    std::string const all = formatNames();
    std::size_t at = 0;
    while (at < all.size()) {
        std::size_t const end = std::min(all.find(", ", at), all.size());
        names.push_back(all.substr(at, end - at));
        at = end + 2;
    }
    return names;
}

Words const &logLevels() {
    static Words const levels{"quiet", "panic", "error", "warning", "info", "verbose", "trivia"};
    return levels;
}

} // namespace

std::vector<SourceRow> sourceTable() {
    std::string const lumo = "storage internal lumo ";
    Words const operations{"*",
                           "createVirtualVolume",
                           "deleteVirtualVolume",
                           "bindVirtualVolume",
                           "unbindVirtualVolume",
                           "queryStorageArray",
                           "queryStorageContainer",
                           "queryVirtualVolume",
                           "spaceStatsForVirtualVolume",
                           "unsharedChunksVirtualVolume",
                           "getMetadata",
                           "setContext"};
    return {
        // Of several rows that fit, the first counts.
        {"", "format", words(formats())},
        {"", "root", {Kind::Directories}},
        {"", "plugins", {Kind::Directories}},
        {"", "log-level", words(logLevels())},
        {lumo + "orkaprovider add", "vp-name", {Kind::Text}},
        {"*", "vp-name", live(Live::Providers)},
        {"*", "activevpurl", live(Live::ProviderUrls)},
        {"*", "arrayid", live(Live::Arrays)},
        {"*", "array", live(Live::Arrays)},
        {lumo + "orkaprovider injectfault", "status", words({"online", "offline", "syncError", "unknown", "default"})},
        {lumo + "storagecontainer add", "container-id", live(Live::ExportedContainers)},
        {lumo + "storagecontainer add", "container-name", live(Live::ExportedContainerNames)},
        {lumo + "virtualvolume get", "container-id", live(Live::ExportedContainers)},
        {lumo + "virtualvolume metadata list", "container-id", live(Live::ExportedContainers)},
        {"*", "container-id", live(Live::MountedContainers)},
        {lumo + "storagecontainer checklumos", "path", live(Live::MountedPaths)},
        {"*", "lumo", live(Live::VolumeIds)},
        {lumo + "orkacontext set", "uuid", {Kind::Text}},
        {"*", "uuid", live(Live::VolumeIds)},
        {lumo + "configlumo mount", "name", live(Live::UnmountedVolumes)},
        {lumo + "configlumo umount", "name", live(Live::MountedVolumes)},
        {lumo + "configlumo remove", "name", live(Live::Volumes)},
        {"*", "policy-file", {Kind::Files}},
        {lumo + "daemon set", "log-level", words(logLevels())},
        {lumo + "daemon set", "start-pe-apd", live(Live::Endpoints)},
        {lumo + "daemon set", "end-pe-apd", live(Live::Outages)},
        {"*", "fault",
         words({"STORAGE_FAULT", "OUT_OF_RESOURCE", "RESOURCE_BUSY", "PERMISSION_DENIED", "NOT_FOUND", "TIMEOUT",
                "LOST_SESSION"})},
        {"*", "operation", words(operations)},
        {"cli describe", "path", {Kind::Path}},
        {"cli completion", "shell", words({"bash", "zsh", "fish"})},
        {"cli plugin check", "file", {Kind::Files}},
    };
}

ValueSource sourceOf(std::string const &path, CallSpec::ParameterSpec const &parameter) {
    switch (parameter.GetType()) {
    case CallSpec::Flag:
        return {Kind::Flag};
    case CallSpec::Bool:
    case CallSpec::BoolList:
        return words({"true", "false"});
    case CallSpec::Int:
    case CallSpec::IntList:
        return {Kind::Text};
    default:
        break;
    }
    static std::vector<SourceRow> const table = sourceTable();
    for (SourceRow const &row : table) {
        bool const fits = row.path == path || (row.path == "*" && !path.empty());
        if (fits && row.parameter == parameter.GetName()) {
            return row.source;
        }
    }
    return {Kind::Text};
}

} // namespace Tovicli::Cli
