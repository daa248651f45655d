// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <unistd.h>

namespace Lumod {

ReplyPtr ping(Core &core, CallPtr const &, Wire::Request::Reader) {
    return singleReply([&core](Wire::Reply::Builder reply) {
        Wire::Pong::Builder pong = reply.initPong();
        pong.setVersion(core.settings.version.c_str());
        pong.setPid(static_cast<uint32_t>(::getpid()));
        pong.setUptimeMs(static_cast<uint64_t>((core.timer.now() - core.started) / kj::MILLISECONDS));
        pong.setRoot(core.settings.root.c_str());
    });
}

} // namespace Lumod
