// SPDX-License-Identifier: Apache-2.0
#include "CommandFrame.h"

namespace TarselCli::LumoNamespace {

using namespace Plexa;

InputSpecPtr declareParameters(std::initializer_list<Parameter> parameters) {
    InputSpecPtr const spec = CallSpec::InputSpec::New();
    for (Parameter const &parameter : parameters) {
        auto const declared = CallSpec::ParameterSpec::New(parameter.name, parameter.type);
        if (parameter.alias != nullptr) {
            declared->SetAlias(parameter.alias);
        }
        declared->SetDescription(parameter.description);
        declared->SetRequired(parameter.required);
        spec->AddParameter(declared);
    }
    return spec;
}

OutputSpecPtr declareResult(boost::shared_ptr<MetaObj::MetaObject> const &schema) {
    OutputSpecPtr const spec = CallSpec::OutputSpec::New();
    spec->SetOutputType(schema);
    return spec;
}

ListPtr makeStructList(StructPtr const &elementSchema) {
    return MetaObj::MetaList::New(MetaObj::StructList, elementSchema);
}

} // namespace TarselCli::LumoNamespace
