// SPDX-License-Identifier: Apache-2.0
//
// Stands for the daemon's client library; compiled twice, each telling which one it is.
#include "lumolib/LastFailure.h"
#include "lumolib/LumoLib.h"

extern "C" {

LUMOLIB_EXPORT char const *LumoLib_Err2String(int32_t) {
    return "answered by " TEST_CLIENT_NAME;
}

bool LumoPlatform_LastFailure(LumoLastFailure *out) {
    *out = {1, "noted by " TEST_CLIENT_NAME, ""};
    return true;
}

void LumoPlatform_ClearLastFailure(void) {}
// Counts nothing and traces nothing, as a platform of somebody else's may.
}
