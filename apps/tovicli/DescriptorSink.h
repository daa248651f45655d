// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "plexa/Sink.h"

namespace Tovicli {

/// Writes to a descriptor at once and remembers the first error. Asked for problems, it also asks a file system that
/// writes later (a network's, one with quotas).
class DescriptorSink : public Plexa::Sink {
public:
    /// @param descriptor stays the caller's
    explicit DescriptorSink(int descriptor);
    void write(std::string_view text) override;
    std::string problem() const override;

private:
    int descriptor_;
    int error_ = 0;
    bool hasWritten_ = false;
};

} // namespace Tovicli
