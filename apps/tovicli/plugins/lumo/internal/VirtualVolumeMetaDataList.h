// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

/// `virtualvolume metadata list`: one virtual volume's metadata, as the daemon has it.
class LUMO_COMMAND_EXPORT VirtualVolumeMetaDataList : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<VirtualVolumeMetaDataList> New();
    VirtualVolumeMetaDataList();
    InputSpecPtr GetInputSpecInternal() override;
    OutputSpecPtr GetOutputSpecInternal() override;
    /// A key and its value.
    StructPtr GetOutputStructure();
    void ExecuteInternal(InputPtr const &input, OutputPtr const &output) override;
};

} // namespace TarselCli::LumoNamespace
