// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "PluginSource.h"
#include "plexa/Sink.h"

namespace Tovicli {

/// Tells the user on standard error what went wrong: lines that begin with the program's name, or one JSON document
/// where standard output is for a program.
class ErrorReport {
public:
    explicit ErrorReport(Plexa::Sink &sink)
        : sink_(sink) {}

    void setMachine(bool machine) {
        machine_ = machine;
    }
    bool isMachine() const {
        return machine_;
    }
    void setShowRequestId(bool show) {
        showRequestId_ = show;
    }

    /// A line beside the matter. Always plain: it is no error.
    void warn(std::string_view text);
    /// What failed, as it is to be read; line ends inside it are kept.
    /// @param hint a further line for people
    void fail(std::string_view message, std::optional<LastFailure> const &cause = std::nullopt,
              std::string_view hint = {});

private:
    void line(std::string_view prefix, std::string_view text);

    Plexa::Sink &sink_;
    bool machine_ = false;
    bool showRequestId_ = false;
};

} // namespace Tovicli
