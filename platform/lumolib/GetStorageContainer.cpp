// SPDX-License-Identifier: Apache-2.0
#include <memory>

#include "Session.h"
#include "StorageRecords.h"
#include "lumolib/Progress.h"

using namespace LumoClient;

LumoErrorEx LumoLib_GetStorageContainer(int32_t, void const *, StorageContainerResult **result) {
    return answerEx([result](Connection &connection) {
        requireOut(result);
        auto owned = std::make_unique<Owned<StorageContainerResult>>();
        StorageRecords records(owned->arena, connection);
        connection.request(
            Repeat::Always, connection.deadline(),
            [](Compact::Request::Builder request) { request.setGetStorageContainer(); },
            [&records](Compact::Reply::Reader reply) { records.take(reply); });
        records.finish(*owned);
        LumoPlatform_NoteProgress(0, owned->containerCount);
        *result = owned.release();
    });
}

void LumoLib_FreeStorageContainerResult(StorageContainerResult *result) {
    Owned<StorageContainerResult>::free(result);
}
