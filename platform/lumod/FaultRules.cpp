// SPDX-License-Identifier: Apache-2.0
#include "FaultRules.h"

#include <algorithm>
#include <array>

#include <fmt/format.h>

namespace Lumod {

using Wire::ErrorCode;
using Wire::Failure;

namespace {

constexpr std::string_view wildcard = "*";

std::string listOf(std::size_t count, char const *(*nameAt)(std::size_t)) {
    std::string list;
    for (std::size_t index = 0; index < count; ++index) {
        list += fmt::format("{}{}", index == 0 ? "" : ", ", nameAt(index));
    }
    return list;
}

} // namespace

FaultRules::Target FaultRules::targetOf(std::string_view faultName, std::string_view operationName) {
    auto const fault = faultNamed(faultName);
    if (!fault) {
        throw Failure(ErrorCode::UnknownFault,
                      fmt::format("there is no fault '{}'; the faults are {}", faultName,
                                  listOf(faultCount, [](std::size_t at) { return nameOf(static_cast<Fault>(at)); })));
    }
    if (operationName == wildcard) {
        return {*fault, std::nullopt};
    }
    auto const operation = operationNamed(operationName);
    if (!operation) {
        throw Failure(
            ErrorCode::UnknownOperation,
            fmt::format("there is no provider operation '{}'; the operations are {}", operationName,
                        listOf(operationCount, [](std::size_t at) { return nameOf(static_cast<Operation>(at)); })));
    }
    if (!isLegal(*fault, *operation)) {
        throw Failure(ErrorCode::IllegalFault,
                      fmt::format("the fault {} is not legal for {}", faultName, operationName));
    }
    return {*fault, operation};
}

FaultRules::Rule *FaultRules::find(Target const &target) {
    auto const rule = std::find_if(rules_.begin(), rules_.end(), [&target](Rule const &candidate) {
        return candidate.fault == target.fault && candidate.operation == target.operation;
    });
    return rule == rules_.end() ? nullptr : &*rule;
}

void FaultRules::restart(Rule &rule) const {
    rule.seen = 0;
    rule.since = clock_.now();
}

void FaultRules::setEnabled(bool enabled) {
    if (enabled && !enabled_) {
        std::for_each(rules_.begin(), rules_.end(), [this](Rule &rule) { restart(rule); });
    }
    enabled_ = enabled;
}

void FaultRules::add(std::string_view fault, std::string_view operation, int32_t frequency, int32_t timeMs) {
    Target const target = targetOf(fault, operation);
    if (frequency <= 0 && timeMs <= 0) {
        throw Failure(ErrorCode::InvalidArgument,
                      fmt::format("the rule for {} and {} names neither a frequency nor a time", fault, operation));
    }
    if (find(target) != nullptr) {
        throw Failure(ErrorCode::RuleExists, fmt::format("there is a rule for {} and {} already", fault, operation));
    }
    rules_.push_back({target.fault, target.operation, frequency, timeMs, 0, 0, clock_.now()});
}

void FaultRules::modify(std::string_view fault, std::string_view operation, int32_t frequency, int32_t timeMs) {
    Rule *const rule = find(targetOf(fault, operation));
    if (rule == nullptr) {
        throw Failure(ErrorCode::NoSuchRule, fmt::format("there is no rule for {} and {}", fault, operation));
    }
    if (frequency <= 0 && timeMs <= 0) {
        rules_.erase(rules_.begin() + (rule - rules_.data()));
        return;
    }
    rule->frequency = frequency;
    rule->timeMs = timeMs;
    restart(*rule);
}

bool FaultRules::countsAndIsDue(Rule &rule) const {
    ++rule.seen;
    bool const byCount = rule.frequency > 0 && rule.seen >= rule.frequency;
    bool const byTime = rule.timeMs > 0 && clock_.now() - rule.since > rule.timeMs * kj::MILLISECONDS;
    return byCount || byTime;
}

std::optional<Failure> FaultRules::strike(Operation operation, std::string_view provider) {
    if (!enabled_) {
        return std::nullopt;
    }
    for (bool const exact : {true, false}) {
        for (Rule &rule : rules_) {
            bool const applies =
                exact ? rule.operation == operation : !rule.operation && isLegal(rule.fault, operation);
            if (!applies || !countsAndIsDue(rule)) {
                continue;
            }
            restart(rule);
            ++rule.fired;
            return Failure(codeOf(rule.fault), fmt::format("injected fault {} in {} of provider '{}'",
                                                           nameOf(rule.fault), nameOf(operation), provider));
        }
    }
    return std::nullopt;
}

} // namespace Lumod
