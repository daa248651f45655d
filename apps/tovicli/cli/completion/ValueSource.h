// SPDX-License-Identifier: Apache-2.0
//
// Where the values come from that can be offered for a parameter. Declarations say what kind a value is, not what it
// names; one table in ValueSource.cpp says that, for the parameters whose values are known somewhere. A test holds the
// table against the declarations.
#pragma once

#include <string>
#include <vector>

#include "plexa/CallSpec.h"

namespace Tovicli::Cli {

/// Values that only the host or its daemon know.
enum class Live {
    Providers,
    ProviderUrls,
    Arrays,
    ExportedContainers,     ///< ids
    ExportedContainerNames, ///< of those that are not mounted
    MountedContainers,      ///< ids
    MountedPaths,
    Volumes, ///< directory names of config volumes
    MountedVolumes,
    UnmountedVolumes,
    VolumeIds,
    Endpoints, ///< uids
    Outages,   ///< uids of endpoints
};

struct ValueSource {
    enum class Kind {
        Flag, ///< takes no value
        Text, ///< nothing is known
        Words,
        Files,
        Directories,
        Path, ///< further words of a command's path
        Live,
    };
    Kind kind = Kind::Text;
    std::vector<std::string> words = {};
    Live live = Live::Providers;
};

/// @param path the command's words, a blank between them; empty for the tool's own options
ValueSource sourceOf(std::string const &path, Plexa::CallSpec::ParameterSpec const &parameter);

/// A row of the table: which parameter of which command, or of every one that has it.
struct SourceRow {
    std::string path; ///< empty for the tool's own options, "*" for every command
    std::string parameter;
    ValueSource source;
};
std::vector<SourceRow> sourceTable();

} // namespace Tovicli::Cli
