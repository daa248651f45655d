// SPDX-License-Identifier: Apache-2.0
#include "ConfigLumoAdd.h"

#include <fstream>

#include <boost/make_shared.hpp>

#include "ConfigLumo.h"
#include "gantry/Lib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<ConfigLumoAdd> ConfigLumoAdd::New() {
    return boost::make_shared<ConfigLumoAdd>();
}

ConfigLumoAdd::ConfigLumoAdd() {
    SetDescription("ConfigLumoAdd a config Lumo in a given Lumo StorageContainer.");
    SetMetaDataField("type", "operation");
}

InputSpecPtr ConfigLumoAdd::GetInputSpecInternal() {
    return declareParameters({
        {"name", CallSpec::String, "n", true, "Directory Name"},
        {"container-id", CallSpec::String, "c", true, "StorageContainer ID"},
        {"size", CallSpec::Int, "s", false, "Size of the meta-lumo object in MB"},
        {"policy", CallSpec::String, "p", false, "Policy string for meta-lumo object"},
        {"vmuuid", CallSpec::String, "v", false, "VM Uuid string for meta-lumo object"},
        {"policy-file", CallSpec::String, "f", false, "Policy file for meta-lumo object"},
        {"priority", CallSpec::Flag, nullptr, false,
         "Use priority socket to allow out-of-order execution of this request"},
    });
}

OutputSpecPtr ConfigLumoAdd::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

namespace {

/// The file's first line without its newline; empty when the file cannot be read or the line is longer than a policy
/// may be. Reads no further than that, so that a device or a pipe without a line end cannot hold the command up. (A
/// pipe that nobody writes into is waited for, as by any reader.)
std::string firstLine(std::string const &path) {
    constexpr std::size_t longest = std::size_t{64} * 1024;
    std::ifstream file(path);
    std::string line;
    for (char next = 0; file.get(next) && next != '\n';) {
        line += next;
        if (line.size() > longest) {
            return "";
        }
    }
    return file.bad() ? "" : line;
}

std::string readPolicy(InputPtr const &input) {
    if (input->HasParameter("policy-file")) {
        return firstLine(input->GetString("policy-file"));
    }
    return input->HasParameter("policy") ? input->GetString("policy") : "";
}

} // namespace

void ConfigLumoAdd::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    Kestrel::Storage::StorageInfoImpl host;
    std::string const name = input->GetString("name");
    std::string const containerId = input->GetString("container-id");
    bool const priority = input->HasParameter("priority");
    int64_t const sizeMb = input->HasParameter("size") ? input->GetInt("size") : 0;
    std::string const vmUuid = input->HasParameter("vmuuid") ? input->GetString("vmuuid") : "";
    std::string const policy = readPolicy(input);

    FileSystems const fileSystems = mountedFileSystems(host);
    Gantry::Storage::LumoFileSystem *const fileSystem = findContainer(fileSystems, containerId);
    if (fileSystem == nullptr) {
        reportUnknownContainer(output, containerId);
        return;
    }
    try {
        std::string uuid;
        fileSystem->CreateConfigLumo(name, policy, sizeMb, vmUuid, uuid, "", priority);
        output->SetResult(MetaObj::MetaBool::New(true));
        output->Complete();
    } catch (Gantry::Lib::GantryException const &failure) {
        output->SetMessage("Failed to create Config-Lumo. " + failure.GetMessage());
    }
}

} // namespace TarselCli::LumoNamespace
