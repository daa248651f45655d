// SPDX-License-Identifier: Apache-2.0
#include "conformance/Cases.h"

#include <iterator>

namespace Orka::Conformance {

namespace {

Cases gathered() {
    Cases all;
    for (auto *const part :
         {arrayCases,       containerCases,   creationCases,    deletionCases,   bindingCases,     volumeListCases,
          volumeIdCases,    volumeNameCases,  boundVolumeCases, volumeFactCases, spaceCases,       metadataCases,
          contextCases,     unknownNameCases, idempotencyCases, deadlineCases,   hostileNameCases, hostileArgumentCases,
          concurrencyCases, cutCases,         lifetimeCases,    residueCases}) {
        auto cases = part();
        all.insert(all.end(), std::make_move_iterator(cases.begin()), std::make_move_iterator(cases.end()));
    }
    return all;
}

} // namespace

Cases const &allCases() {
    static Cases const all = gathered();
    return all;
}

} // namespace Orka::Conformance
