// SPDX-License-Identifier: Apache-2.0
//
// Fault-injection rules as the user gives them. A rule names a fault and a provider operation, and says when it fires:
// every so many operations, or when so much time has passed since the last injection.
#pragma once

#include <string>

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

struct FaultTrigger {
    std::string fault;
    std::string operation;
    /// In operations; -1 when not given.
    int32_t frequency = -1;
    /// In milliseconds; -1 when not given.
    int32_t timeMs = -1;

    /// A value of 0 or less counts as not given.
    bool isGiven() const {
        return timeMs > 0 || frequency > 0;
    }
};

/// The parameters of adding and of changing a rule.
InputSpecPtr declareTriggerParameters();

/// Reads fault, operation, frequency and time, in this order. The numbers keep their low 32 bits.
FaultTrigger readTrigger(InputPtr const &input);

/// @return the operation; "*", every operation, when none was given.
std::string readOperation(InputPtr const &input);

} // namespace TarselCli::LumoNamespace
