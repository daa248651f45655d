// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace Orka::Conformance {

class Probe;

/// One demand on a provider. The function returns when it is met, and throws what Expect.h tells when it is not.
struct Case {
    std::string name;
    std::string demand;
    std::function<void(Probe &)> run;
};

using Cases = std::vector<Case>;

// One function a file of cases/.
Cases arrayCases();
Cases containerCases();
Cases creationCases();
Cases deletionCases();
Cases bindingCases();
Cases volumeListCases();
Cases volumeIdCases();
Cases volumeNameCases();
Cases boundVolumeCases();
Cases volumeFactCases();
Cases spaceCases();
Cases metadataCases();
Cases contextCases();
Cases unknownNameCases();
Cases idempotencyCases();
Cases deadlineCases();
Cases hostileNameCases();
Cases hostileArgumentCases();
Cases concurrencyCases();
Cases cutCases();
Cases lifetimeCases();
Cases residueCases();

/// All of them in the order in which they run.
Cases const &allCases();

} // namespace Orka::Conformance
