// SPDX-License-Identifier: Apache-2.0
//
// Rules that make provider operations fail on purpose. A rule names a fault and an operation, or "*" for every
// operation that the fault is legal for, and fires at every n-th operation, or when the time since it last fired
// exceeds its limit; with both, whichever comes first, and firing starts both anew.
//
// Rules for the operation itself are tried before wildcards, each group in the order in which rules were added. A rule
// that is tried counts the operation; the first that is due fires, and those behind it are not tried. Nothing is
// counted while injection is disabled, and enabling it starts every rule anew.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <kj/timer.h>

#include "FaultNames.h"
#include "wire/Failure.h"

namespace Lumod {

class FaultRules {
public:
    struct Rule {
        Fault fault;
        std::optional<Operation> operation; ///< nothing: the wildcard
        int32_t frequency;                  ///< every n-th operation; 0 or less: not given
        int32_t timeMs;                     ///< 0 or less: not given
        int64_t seen = 0;                   ///< operations since it last fired
        int64_t fired = 0;
        kj::TimePoint since; ///< when it last fired, or began to be in force
    };

    /// @param clock monotonic; the caller's, and outlives the rules
    explicit FaultRules(kj::Timer const &clock)
        : clock_(clock) {}

    bool enabled() const {
        return enabled_;
    }
    void setEnabled(bool enabled);

    /// @throws Wire::Failure UnknownFault, UnknownOperation, IllegalFault, InvalidArgument (no trigger), RuleExists
    void add(std::string_view fault, std::string_view operation, int32_t frequency, int32_t timeMs);
    /// Changes a rule's triggers and starts it anew; without any trigger removes the rule.
    /// @throws Wire::Failure UnknownFault, UnknownOperation, IllegalFault, NoSuchRule
    void modify(std::string_view fault, std::string_view operation, int32_t frequency, int32_t timeMs);

    /// To be asked before each operation of a provider.
    /// @return the failure that takes the operation's place, if one does
    std::optional<Wire::Failure> strike(Operation operation, std::string_view provider);

    std::vector<Rule> const &rules() const {
        return rules_;
    }

private:
    struct Target {
        Fault fault;
        std::optional<Operation> operation;
    };

    static Target targetOf(std::string_view fault, std::string_view operation);
    Rule *find(Target const &target);
    void restart(Rule &rule) const;
    bool countsAndIsDue(Rule &rule) const;

    kj::Timer const &clock_;
    bool enabled_ = false;
    std::vector<Rule> rules_;
};

} // namespace Lumod
