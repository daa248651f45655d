// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "orka/Provider.h"

namespace Orka::Conformance {

/// What an operation is to be performed on.
struct Subject {
    std::string containerId;
    std::string uuid;
    std::string endpoint;
    std::string name; ///< of the volume that is to be made, or looked for
};

/// An operation of the interface as data, so that what holds for all of them is demanded of each. The answer is
/// dropped.
struct Operation {
    char const *name;
    bool namesContainer;
    bool namesVolume;
    kj::Promise<Outcome<Done>> (*perform)(Provider &provider, CallContext context, Subject const &subject);
};

/// Every one, in the interface's order.
std::vector<Operation> const &operations();

} // namespace Orka::Conformance
