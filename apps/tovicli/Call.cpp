// SPDX-License-Identifier: Apache-2.0
#include "Call.h"

#include <exception>

#include "FailureText.h"
#include "gantry/Lib.h"
#include "kestrel/Lib.h"
#include "plexa/UsageError.h"
#include "wire/ErrorCode.h"

namespace Tovicli {

using namespace Plexa;

namespace {

/// Failures that mean: there is nobody to ask, or nobody answered in time.
bool isUnavailable(std::optional<LastFailure> const &cause) {
    if (!cause) {
        return false;
    }
    switch (static_cast<Wire::ErrorCode>(cause->code)) {
    case Wire::ErrorCode::DaemonNotRunning:
    case Wire::ErrorCode::ConnectionLost:
    case Wire::ErrorCode::NoSession:
    case Wire::ErrorCode::DeadlineExceeded:
        return true;
    default:
        return false;
    }
}

bool isFalse(boost::shared_ptr<MetaObj::MetaObject> const &result) {
    auto const truth = boost::dynamic_pointer_cast<MetaObj::MetaBool>(result);
    return truth != nullptr && truth->IsSet() && !truth->GetValue();
}

/// What an output means that a command returned from.
void judge(CallSpec::Output const &output, Outcome &outcome) {
    if (output.HasMessage()) {
        outcome.message = output.GetMessage();
    } else if (isFalse(outcome.result)) {
        outcome.message = "the command reported failure";
    } else if (!output.IsComplete()) {
        outcome.message = "the command ended without completing its output";
    } else {
        return;
    }
    outcome.status = ExitStatus::Failed;
}

} // namespace

Outcome call(AutoCli::Command &command, boost::shared_ptr<CallSpec::Input> const &input, PluginSource &plugins) {
    Outcome outcome;
    auto const output = CallSpec::Output::New();
    plugins.clearLastFailure();
    try {
        command.Execute(input, output);
        outcome.result = output->GetResult();
        judge(*output, outcome);
    } catch (Kestrel::Lib::KestrelException const &failure) {
        outcome.status = ExitStatus::Unavailable;
        outcome.message = failure.GetMessage();
    } catch (Gantry::Lib::GantryException const &failure) {
        outcome.status = ExitStatus::Failed;
        outcome.message = failure.GetMessage();
    } catch (UsageError const &mistake) { // which only the command itself could see
        outcome.status = ExitStatus::Usage;
        outcome.message = mistake.sentence();
    } catch (std::exception const &failure) {
        outcome.status = ExitStatus::Failed;
        outcome.message = textOf(failure);
    } catch (...) {
        outcome.status = ExitStatus::Failed;
        outcome.message = "the command failed with an exception of an unknown kind";
    }
    outcome.cause = plugins.lastFailure();
    if (outcome.status == ExitStatus::Failed && isUnavailable(outcome.cause)) {
        outcome.status = ExitStatus::Unavailable;
    }
    return outcome;
}

} // namespace Tovicli
