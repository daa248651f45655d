// SPDX-License-Identifier: Apache-2.0
#include "Declarations.h"

#include "DaemonCommand.h"
#include "FaultInjectionEnable.h"
#include "FaultInjectionRuleAdd.h"
#include "FaultInjectionRuleRemove.h"
#include "FaultInjectionRuleSet.h"
#include "OrkaContextSet.h"
#include "VirtualVolumeGet.h"
#include "VirtualVolumeMetaDataList.h"

using namespace TarselCli::LumoNamespace;

namespace PluginTest {

std::vector<Declaration> daemonDeclarations() {
    return {
        {"FaultInjectionEnable",
         FaultInjectionEnable::New,
         "storage internal lumo faultInjection enable",
         "Enable or disable Orka Fault Injection.",
         "operation",
         "simple",
         {},
         {"enabled e boolean required: true / false"},
         "bool",
         0},
        {"FaultInjectionRuleAdd",
         FaultInjectionRuleAdd::New,
         "storage internal lumo faultInjection rule add",
         "Add a fault injection rule.",
         "operation",
         "simple",
         {},
         {"fault f string required: The fault name (e.g. - \"STORAGE_FAULT\")",
          "operation o string optional: The Orka op (e.g. - \"createVirtualVolume\") as listed in the Orka 2.0 "
          "specification -- omit this parameter to create a 'wildcard' rule which injects this fault for all "
          "operations for which it is legal.",
          "frequency n integer optional: The target frequency in operations.  Either this or time must be specified.",
          "time t integer optional: The rule will be triggered if time since last injection exceeds this limit (in "
          "ms).  Either this or frequency must be specified."},
         "bool",
         0},
        {"FaultInjectionRuleSet",
         FaultInjectionRuleSet::New,
         "storage internal lumo faultInjection rule set",
         "Modify a fault injection rule.",
         "operation",
         "simple",
         {},
         {"fault f string required: The fault name (e.g. - \"STORAGE_FAULT\")",
          "operation o string optional: The Orka op (e.g. - \"createVirtualVolume\") as listed in the Orka 2.0 "
          "specification -- omit this parameter to create a 'wildcard' rule which injects this fault for all "
          "operations for which it is legal.",
          "frequency n integer optional: The target frequency in operations.  Either this or time must be specified.",
          "time t integer optional: The rule will be triggered if time since last injection exceeds this limit (in "
          "ms).  Either this or frequency must be specified."},
         "bool",
         0},
        {"FaultInjectionRuleRemove",
         FaultInjectionRuleRemove::New,
         "storage internal lumo faultInjection rule remove",
         "Removes a fault injection rule.",
         "operation",
         "simple",
         {},
         {"fault f string required: The fault name (e.g. - \"STORAGE_FAULT\")",
          "operation o string optional: The Orka op (e.g. - \"createVirtualVolume\") as listed in the Orka 2.0 "
          "specification -- omit this parameter to remove a 'wildcard' rule."},
         "bool",
         0},
        {"DaemonCommand",
         DaemonCommand::New,
         "storage internal lumo daemon set",
         "Daemon Command for lumo Operations.",
         "operation",
         "",
         {},
         {"log-level l string optional: log-level <panic|quiet|error|warning|verbose|trivia> log-level is not changed "
          "if parameter is omitted",
          "dump-objects d flag optional: Dump Lumo daemon memory objects to the logdumping of dameon memory is not "
          "done if parameter is omitted",
          "unbind-period t integer optional: Unbind timer interval in microseconds. Unbind Timer interval is defaulted "
          "to 5 mins if parameter is omitted",
          "unbind-now u flag optional: Set this flag to force unbind now. Unbind will happen on the timer if parameter "
          "is omitted",
          "start-pe-apd - string optional: Simulate PE APD start for a given PE. APD simulation is not done if "
          "omitted ",
          "end-pe-apd - string optional: Simulate PE APD end for a given PE. APD simulation is not done if omitted ",
          "disable-spm-space-efficiency-cmds - boolean optional: Disable space efficiency capability commands in SPM. "
          "This means that Lumo Layer will not modify profile based on alloctype."},
         "bool",
         38},
        {"OrkaContextSet",
         OrkaContextSet::New,
         "storage internal lumo orkacontext set",
         "Set the Lumo Orka context (Nexa UUID) on the host.",
         "operation",
         "simple",
         {},
         {"uuid u string optional: The Nexa UUID for the Lumo Orka context you wish to configure on the host",
          "clear c flag optional: Clear the Lumo Orka context for the host"},
         "bool",
         0},
        {"VirtualVolumeGet",
         VirtualVolumeGet::New,
         "storage internal lumo virtualvolume get",
         "Get information about a Virtual Volume.",
         "operation",
         "simple",
         {{"units:LumoInfoInternal.Logical Size", "MB"},
          {"units:LumoInfoInternal.Committed Size", "MB"},
          {"units:LumoInfoInternal.Unshared Size", "MB"},
          {"fields:LumoInfoInternal", "Container Id,Lumo UUID,Logical Size,Committed Size,Unshared Size Valid,Unshared "
                                      "Size,Storage Profile,Block Size"}},
         {"container-id c string required: The storage container the Lumo is in.",
          "uuid u string required: The Lumo UUID."},
         "LumoInfoInternal{Container Id: string, Lumo UUID: string, Logical Size: int, Committed Size: int, Unshared "
         "Size Valid: bool, Unshared Size: int, Storage Profile: string, Block Size: int}",
         0},
        {"VirtualVolumeMetaDataList",
         VirtualVolumeMetaDataList::New,
         "storage internal lumo virtualvolume metadata list",
         "List Virtual Volume MetaData.",
         "operation",
         "table",
         {},
         {"container-id c string required: The storage container the Lumo is in.",
          "uuid u string required: The Lumo UUID."},
         "list of LumoMetaData{key: string, value: string}",
         0},
    };
}

} // namespace PluginTest
