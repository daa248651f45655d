// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <tuple>
#include <vector>

#include "Async.h"
#include "Call.h"
#include "ProviderCalls.h"
#include "View.h"

namespace Lumod {

/// A registered provider whose arrays and containers are not in the view.
struct Absence {
    ProviderPtr provider;
    Wire::Failure reason;
};

/// What one round of questions to all providers gave.
struct Survey {
    std::shared_ptr<View const> view;
    std::vector<Absence> failed;  ///< could not be asked
    std::vector<Absence> offline; ///< not asked

    bool isComplete() const {
        return failed.empty() && offline.empty();
    }
    /// @throws Wire::Failure the first provider's failure when providers were asked and none answered
    void requireAnAnswer() const;
    /// @throws Wire::Failure NoSuchContainer; NoActiveProvider; the failure of a provider that may know more
    ServedContainer const &container(std::string const &containerId) const;
};

/// Asks every provider that is not offline for its arrays and containers, all at the same time, and puts the answers
/// together. A provider that fails is left out, with a line in the log.
///
/// Among several providers a silent one costs the others half of one request's time. From then on it is left out at
/// once, and asked apart from any request until it answers.
class Surveyor {
public:
    explicit Surveyor(Services &services)
        : services_(services) {}

    /// Failures: the host store's.
    Answer<Survey> survey(CallPtr const &call);

private:
    /// What the providers are asked under. Where there are several, a silent one may use half of the time only, so that
    /// the rest can still be done on the others.
    CallPtr inquiryOf(CallPtr const &call, std::size_t providers) const;
    Answer<Source> ask(ProviderPtr const &provider, CallPtr const &call, int attemptsLeft) const;
    /// Asks one of several: notices that it is silent, and does not wait for it then.
    Answer<Source> askAmongOthers(ProviderPtr const &provider, CallPtr const &inquiry);
    void noteSilence(ProviderPtr const &provider);
    /// Asks a silent provider until it answers, or until it is no longer registered.
    kj::Promise<void> tryUntilAnswered(ProviderPtr provider);
    bool isRegistered(ProviderPtr const &provider) const;
    Survey assemble(std::vector<ProviderPtr> const &asked, kj::Array<Outcome<Source>> answers, CallPtr const &call);
    std::shared_ptr<View const> viewOf(std::vector<Source> sources);
    void tellContext(ProviderPtr const &provider, CallPtr const &call);

    /// What a view was made of.
    using Fingerprint = std::vector<std::tuple<ProviderEntry const *, uint64_t, uint64_t>>;

    Services &services_;
    std::shared_ptr<View const> view_; ///< kept while nothing that it was made of has changed
    Fingerprint fingerprint_;
    uint64_t revision_ = 0;
};

} // namespace Lumod
