// SPDX-License-Identifier: Apache-2.0
//
// Whether a provider keeps the promises of Provider.h, found out by asking it. Some two hundred cases, each with a name
// and one sentence of what it demands, go through the interface alone, so that they judge every provider alike: one in
// the process, one behind a network, one that somebody else wrote.
//
// Called by the program orka-conformance and by tests. A kit owns no event loop: it is given one, waits on it, and
// returns when the last case is done. It changes the array that it asks, in volumes of its own whose names begin with
// ownNamePrefix; it removes each of them when its case ends, however that ends. Beside it the array should be quiet.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <kj/async.h>
#include <kj/timer.h>

#include "orka/Provider.h"

namespace Orka::Conformance {

/// Directory names of the kit's volumes begin with this; the run's id follows.
inline constexpr char const *ownNamePrefix = "orka-kit-";

enum class Verdict {
    Passed,
    Failed,
    Skipped ///< the array holds nothing that the case could be tried on
};

/// What is told of a case before it runs.
struct CaseTitle {
    std::string name;   ///< nouns, then what is tried: volume/create/name-taken
    std::string demand; ///< one sentence
};

/// What came of a case. Texts hold no control characters and only valid UTF-8, whatever the provider answered.
struct CaseResult {
    CaseTitle title;
    Verdict verdict = Verdict::Passed;
    std::string expected; ///< when it failed
    std::string came;     ///< when it failed
    std::string reason;   ///< when it was skipped
    kj::Duration took = 0 * kj::NANOSECONDS;
};

struct Report {
    std::vector<CaseResult> results;
    bool interrupted = false;
    /// What the kit made and could not remove, one sentence each.
    std::vector<std::string> leftBehind;

    size_t count(Verdict verdict) const;
};

/// What a kit works with. Everything outlives it.
struct Surroundings {
    kj::WaitScope &scope;
    kj::Timer &timer;
    /// A new connection to the provider under test; nothing of one is shared with another.
    std::function<std::unique_ptr<Provider>()> connect;
    /// Makes this run's names and idempotency keys its own: an array remembers keys from one run to the next.
    std::string runId;
    /// Decides moments and orders that a case leaves open.
    uint64_t seed = 1;
    /// What an operation is given.
    kj::Duration timeout = 10 * kj::SECONDS;
    /// Ends when the run is to end early; null: never.
    std::function<kj::Promise<void>()> interruption;
    /// A program that performs one mutation and is killed at it (Victim.h), with its first words; empty: the cases that
    /// need one are skipped.
    std::vector<std::string> victim;
};

/// Every case in the order in which they run.
std::vector<CaseTitle> caseTitles();

class Kit {
public:
    explicit Kit(Surroundings surroundings);
    ~Kit() noexcept;
    Kit(Kit const &) = delete;
    Kit &operator=(Kit const &) = delete;

    /// Asks for what the cases are tried on. @return why the provider is of no use, if it is not
    std::optional<Wire::Failure> reach();

    /// Runs those that are chosen. Only after reach() gave nothing.
    /// @param onResult is told of each as it ends; null: nobody
    Report run(std::function<bool(std::string const &)> const &isChosen,
               std::function<void(CaseResult const &)> const &onResult = nullptr);

private:
    class Implementation;

    std::unique_ptr<Implementation> implementation_;
};

} // namespace Orka::Conformance
