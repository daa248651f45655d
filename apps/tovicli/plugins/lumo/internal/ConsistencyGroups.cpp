// SPDX-License-Identifier: Apache-2.0
#include "ConsistencyGroups.h"

#include "lumolib/LumoLib.h"

namespace TarselCli::LumoNamespace {

void answerNoGroups(InputPtr const &input, OutputPtr const &output, StructPtr const &schema) {
    input->GetStringList("cgid");
    input->GetString("vp-name");
    ListPtr const groups = makeStructList(schema);
    // Stays with the process: no close matches this open.
    if (!LumoLib_Init(0, 0)) {
        output->SetMessage("Failed to initialize LumoLib");
        return;
    }
    output->SetResult(groups);
    output->Complete();
}

} // namespace TarselCli::LumoNamespace
