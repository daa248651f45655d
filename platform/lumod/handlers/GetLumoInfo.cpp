// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

namespace Lumod {

Answer<ReplyPtr> getLumoInfo(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    return andThen(core.volumes.find(call, VolumeName::of(request.getGetLumoInfo())), [](FoundVolume found) {
        return singleReply([profile = std::move(found.volume.profile)](Wire::Reply::Builder reply) {
            Wire::LumoInfo::Builder info = reply.initLumoInfo();
            if (profile) {
                info.setStorageProfile(profile->c_str());
            }
        });
    });
}

} // namespace Lumod
