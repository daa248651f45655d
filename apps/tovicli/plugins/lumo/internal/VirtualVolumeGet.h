// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `virtualvolume get`: one virtual volume's sizes, storage profile and block size.
class LUMO_COMMAND_EXPORT VirtualVolumeGet : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<VirtualVolumeGet> New();
    VirtualVolumeGet();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    /// A virtual volume.
    StructPtr GetOutputStructure();
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
