// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include "StorageReply.h"

namespace Lumod {

Answer<ReplyPtr> getStorageContainer(Core &core, CallPtr const &call, Wire::Request::Reader) {
    return andThen(core.surveyor.survey(call), [&core](Survey survey) {
        survey.requireAnAnswer();
        std::vector<ServedContainer> const &containers = survey.view->containers();
        std::vector<uint32_t> exported;
        exported.reserve(containers.size());
        for (uint32_t place = 0; place < containers.size(); ++place) {
            if (containers[place].isExported()) {
                exported.push_back(place);
            }
        }
        return storageReply(survey.view, std::move(exported), core.outages.all());
    });
}

} // namespace Lumod
