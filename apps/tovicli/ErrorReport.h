// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "PluginSource.h"
#include "plexa/Sink.h"

namespace Tovicli {

/// Tells the user on standard error what went wrong: "tovicli: what failed: cause (hint)", or, where standard output is
/// for a program, one JSON document in one line, warnings included.
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
    /// Stands in error documents, and with showRequestId() behind a cause.
    void setRequestId(std::string const &requestId) {
        requestId_ = requestId;
    }
    void setShowRequestId(bool show) {
        showRequestId_ = show;
    }

    /// Something beside the matter: a line, or a part of the document.
    void warn(std::string_view text);
    /// What failed, as it is to be read; line ends inside it are kept. Once a run.
    /// @param hint what the user can do about it
    void fail(std::string_view message, std::optional<LastFailure> const &cause = std::nullopt,
              std::string_view hint = {});
    /// At the end of a run that may have gone well: warnings that no error document took along.
    void finish();

private:
    std::string document(std::string_view message, std::optional<LastFailure> const &cause,
                         std::string_view hint) const;
    std::string warningList() const;
    void line(std::string_view prefix, std::string_view text);

    Plexa::Sink &sink_;
    bool machine_ = false;
    bool showRequestId_ = false;
    std::string requestId_;
    std::vector<std::string> held_;
};

} // namespace Tovicli
