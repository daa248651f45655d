// SPDX-License-Identifier: Apache-2.0
//
// Which texts may become the name of a directory on this host. Everything that comes from a user or a provider passes
// here before it is part of a path.
#pragma once

#include <string>

namespace Kestrel {

/// One path component: valid UTF-8 of 1 to 255 bytes, neither "." nor "..", no '/', no NUL and no control characters.
/// Look-alike characters are not folded: two names that differ in a byte are two directories.
/// @param what for the sentence: "directory name", "volume uuid"
/// Throws Wire::Failure (InvalidArgument) that says what is wrong.
void requireDirectoryName(std::string const &name, std::string const &what);

/// The same for the name of a container, which must not begin with '.' either: the directory of containers is listed by
/// people, and hidden entries are the host's own.
void requireContainerName(std::string const &name);

/// The canonical form of a container id. Throws Wire::Failure (InvalidArgument).
std::string requireContainerId(std::string const &text);

/// A volume's uuid in canonical form when it is one; otherwise as it is, provided it may name a directory.
std::string requireVolumeUuid(std::string const &text);

} // namespace Kestrel
