// SPDX-License-Identifier: Apache-2.0
#include "Frame.h"

namespace Tovicli::Cli {

using namespace Plexa;

InputSpecPtr declareParameters(std::initializer_list<Parameter> parameters) {
    auto const spec = CallSpec::InputSpec::New();
    for (Parameter const &parameter : parameters) {
        auto const declared = CallSpec::ParameterSpec::New(parameter.name, parameter.type);
        declared->SetDescription(parameter.description);
        declared->SetRequired(parameter.required);
        spec->AddParameter(declared);
    }
    return spec;
}

OutputSpecPtr declareResult(ObjectPtr const &schema) {
    auto const spec = CallSpec::OutputSpec::New();
    spec->SetOutputType(schema);
    return spec;
}

ListPtr makeStructList(StructPtr const &elementSchema) {
    return MetaObj::MetaList::New(MetaObj::StructList, elementSchema);
}

StructPtr textStructure(char const *name, std::initializer_list<char const *> fields) {
    auto const structure = MetaObj::MetaStruct::New(name);
    for (char const *field : fields) {
        structure->SetField(field, MetaObj::MetaString::New());
    }
    return structure;
}

CliCommand::CliCommand(CliServices &services)
    : services_(services) {
    SetMetaDataField("type", "operation");
}

} // namespace Tovicli::Cli
