// SPDX-License-Identifier: Apache-2.0
//
// The session with the Lumo daemon. It belongs to the process and the client library counts how often it was opened; a
// command either holds one for its object's life (openSession at the end of the constructor, closeSession in the
// destructor) or for one call (CallSession), or leaves one open behind each call (openSession alone).
#pragma once

namespace TarselCli::LumoNamespace {

/// Opens a session that the caller closes with closeSession.
/// @param unit the command's class, which is also the name of its source unit
/// @param line the number that the unit reports as the place of the failure; fixed for each unit
/// @throws Kestrel::Lib::KestrelException when no session can be opened.
void openSession(char const *unit, unsigned line);

void closeSession();

/// A session that is open while the object lives.
class CallSession {
public:
    /// Like openSession.
    CallSession(char const *unit, unsigned line) {
        openSession(unit, line);
    }
    ~CallSession() {
        closeSession();
    }
    CallSession(CallSession const &) = delete;
    CallSession &operator=(CallSession const &) = delete;
};

} // namespace TarselCli::LumoNamespace
