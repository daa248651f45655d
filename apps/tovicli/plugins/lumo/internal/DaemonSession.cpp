// SPDX-License-Identifier: Apache-2.0
#include "DaemonSession.h"

#include <string>

#include "kestrel/Lib.h"
#include "lumolib/LumoLib.h"

namespace TarselCli::LumoNamespace {

void openSession(char const *unit, unsigned line) {
    if (!LumoLib_Init(0, 0)) {
        throw Kestrel::Lib::KestrelException("Unable to initialize lumoLib",
                                             std::string("apps/tovicli/plugins/lumo/internal/") + unit, line,
                                             Gantry::Lib::QuibMessage());
    }
}

void closeSession() {
    LumoLib_Exit();
}

} // namespace TarselCli::LumoNamespace
