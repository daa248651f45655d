// SPDX-License-Identifier: Apache-2.0
#include "orka/conformance/Kit.h"

#include <algorithm>

#include "conformance/Cases.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

size_t Report::count(Verdict verdict) const {
    return static_cast<size_t>(std::count_if(
        results.begin(), results.end(), [verdict](CaseResult const &result) { return result.verdict == verdict; }));
}

std::vector<CaseTitle> caseTitles() {
    std::vector<CaseTitle> titles;
    for (auto const &one : allCases()) {
        titles.push_back({one.name, one.demand});
    }
    return titles;
}

class Kit::Implementation {
public:
    explicit Implementation(Surroundings surroundings)
        : surroundings_(std::move(surroundings)) {}

    std::optional<Wire::Failure> reach();
    Report run(std::function<bool(std::string const &)> const &isChosen,
               std::function<void(CaseResult const &)> const &onResult);

private:
    CaseResult runOne(Case const &one, Report &report);

    Surroundings surroundings_;
    Ground ground_{{}, {}};
    Snapshot before_;
    std::optional<Probe> probe_;
};

std::optional<Wire::Failure> Kit::Implementation::reach() {
    try {
        Probe first(surroundings_, ground_, before_);
        auto const arrays = first.ask(first.provider().queryStorageArray(first.context()));
        if (!arrays.ok()) {
            return arrays.failure();
        }
        auto const containers = first.ask(first.provider().queryStorageContainer(first.context()));
        if (!containers.ok()) {
            return containers.failure();
        }
        ground_ = Ground(*arrays.value().items, *containers.value().items);
        probe_.emplace(surroundings_, ground_, before_);
        before_ = takeSnapshot(*probe_);
        return std::nullopt;
    } catch (Unmet const &unmet) {
        return Wire::Failure(Wire::ErrorCode::ProviderUnreachable,
                             "expected " + unmet.expected + ", came " + unmet.came);
    } catch (Interrupted const &) {
        return Wire::Failure(Wire::ErrorCode::ProviderUnreachable, "interrupted before the provider had answered");
    }
}

CaseResult Kit::Implementation::runOne(Case const &one, Report &report) {
    CaseResult result;
    result.title = {one.name, one.demand};
    auto const begun = surroundings_.timer.now();
    try {
        probe_->begin(one.name);
        one.run(*probe_);
    } catch (Unmet const &unmet) {
        result.verdict = Verdict::Failed;
        result.expected = unmet.expected;
        result.came = unmet.came;
    } catch (Inapplicable const &cause) {
        result.verdict = Verdict::Skipped;
        result.reason = cause.why;
    } catch (Interrupted const &) {
        report.interrupted = true;
        result.verdict = Verdict::Skipped;
        result.reason = "interrupted";
    } catch (kj::Exception const &defect) {
        result.verdict = Verdict::Failed;
        result.expected = "an operation that gives a promise";
        result.came = "thrown: " + printable(defect.getDescription().cStr());
    }
    auto const left = probe_->cleanUp();
    report.leftBehind.insert(report.leftBehind.end(), left.begin(), left.end());
    result.took = surroundings_.timer.now() - begun;
    return result;
}

Report Kit::Implementation::run(std::function<bool(std::string const &)> const &isChosen,
                                std::function<void(CaseResult const &)> const &onResult) {
    Report report;
    for (auto const &one : allCases()) {
        if (report.interrupted || !isChosen(one.name)) {
            continue;
        }
        report.results.push_back(runOne(one, report));
        if (onResult) {
            onResult(report.results.back());
        }
    }
    return report;
}

Kit::Kit(Surroundings surroundings)
    : implementation_(std::make_unique<Implementation>(std::move(surroundings))) {}

Kit::~Kit() noexcept = default;

std::optional<Wire::Failure> Kit::reach() {
    return implementation_->reach();
}

Report Kit::run(std::function<bool(std::string const &)> const &isChosen,
                std::function<void(CaseResult const &)> const &onResult) {
    return implementation_->run(isChosen, onResult);
}

} // namespace Orka::Conformance
