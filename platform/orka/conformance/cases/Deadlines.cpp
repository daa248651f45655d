// SPDX-License-Identifier: Apache-2.0
//
// Every operation ends by its deadline.
#include "conformance/Cases.h"
#include "conformance/Operations.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

using Wire::ErrorCode;

Subject subjectOf(Probe &probe, VirtualVolume const &volume) {
    return {volume.containerId, volume.uuid, probe.ground().endpoint(), probe.freshName()};
}

/// What an operation could have changed.
void isUntouched(Probe &probe, VirtualVolume const &volume, Subject const &subject) {
    expectEqual("the volume", volume, probe.facts(volume));
    expectEqual("how many volumes have the name that was asked for", int64_t{0}, probe.countNamed(subject.name));
}

void passed(Probe &probe, Operation const &operation) {
    auto const made = probe.make();
    auto const subject = subjectOf(probe, made);
    auto context = probe.within(-1 * kj::SECONDS);
    auto const deadline = probe.surroundings().timer.now();
    expectFailure("an operation whose deadline has passed", ErrorCode::DeadlineExceeded,
                  probe.ask(operation.perform(probe.provider(), std::move(context), subject), deadline));
    isUntouched(probe, made, subject);
}

void atOnce(Probe &probe) {
    auto const made = probe.make();
    auto const subject = subjectOf(probe, made);
    for (auto const &operation : operations()) {
        auto const deadline = probe.surroundings().timer.now();
        auto const outcome =
            probe.ask(operation.perform(probe.provider(), probe.within(0 * kj::SECONDS), subject), deadline);
        expectFailure(std::string("\"") + operation.name + "\" with no time at all", ErrorCode::DeadlineExceeded,
                      outcome);
    }
    isUntouched(probe, made, subject);
}

/// Done in time or given up in time, and the connection goes on serving.
void shortTime(Probe &probe, Operation const &operation) {
    auto const made = probe.make();
    auto const subject = subjectOf(probe, made);
    for (auto const time : {1, 5, 20}) {
        auto const deadline = probe.surroundings().timer.now() + time * kj::MILLISECONDS;
        auto const outcome = probe.ask(
            operation.perform(probe.provider(), {deadline, std::nullopt, probe.freshKey()}, subject), deadline);
        // A mutation that was done in the round before has nothing left to do.
        bool const isDone = outcome.ok() || outcome.failure().code() == ErrorCode::AlreadyExists ||
                            outcome.failure().code() == ErrorCode::NoSuchVolume ||
                            outcome.failure().code() == ErrorCode::InUse;
        if (!isDone) {
            expectFailure("success, or a failure for want of time",
                          {ErrorCode::DeadlineExceeded, ErrorCode::ProviderBusy, ErrorCode::ProviderUnreachable},
                          outcome);
        }
    }
    probe.list(probe.containerId(), 1);
}

void longTime(Probe &probe) {
    auto const subject = subjectOf(probe, probe.make());
    for (auto const &operation : operations()) {
        if (!operation.namesVolume) {
            auto context = probe.within(36500 * kj::DAYS);
            expectSuccess(std::string("\"") + operation.name + "\" with a hundred years to go",
                          probe.ask(operation.perform(probe.provider(), std::move(context), subject)));
        }
    }
}

void aHundredAtOnce(Probe &probe) {
    std::vector<kj::Promise<Outcome<Done>>> promises;
    auto const subject = subjectOf(probe, probe.make());
    auto const deadline = probe.surroundings().timer.now() + 50 * kj::MILLISECONDS;
    for (int count = 0; count < 100; ++count) {
        promises.push_back(operations()[static_cast<size_t>(count % 2)].perform(probe.provider(),
                                                                                {deadline, std::nullopt, ""}, subject));
    }
    for (auto &promise : promises) {
        auto const outcome = probe.ask(kj::mv(promise), deadline);
        if (!outcome.ok()) {
            expectFailure("success, or a failure for want of time",
                          {ErrorCode::DeadlineExceeded, ErrorCode::ProviderBusy, ErrorCode::ProviderUnreachable},
                          outcome);
        }
    }
}

} // namespace

Cases deadlineCases() {
    Cases cases;
    for (auto const &operation : operations()) {
        cases.push_back({std::string("deadline/passed/") + operation.name,
                         std::string("With a deadline that has passed, \"") + operation.name +
                             "\" fails at once and changes nothing.",
                         [operation](Probe &probe) { passed(probe, operation); }});
    }
    for (auto const &operation : operations()) {
        cases.push_back({std::string("deadline/short/") + operation.name,
                         std::string("With 1, 5 or 20 ms, \"") + operation.name + "\" is done or given up in time.",
                         [operation](Probe &probe) { shortTime(probe, operation); }});
    }
    cases.push_back({"deadline/none/every-operation", "With no time at all, every operation fails at once.", atOnce});
    cases.push_back(
        {"deadline/far/every-operation", "A deadline in a hundred years is none to worry about.", longTime});
    cases.push_back(
        {"deadline/short/a-hundred", "A hundred operations at once end by their common deadline.", aHundredAtOnce});
    return cases;
}

} // namespace Orka::Conformance
