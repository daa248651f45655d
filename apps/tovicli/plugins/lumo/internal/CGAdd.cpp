// SPDX-License-Identifier: Apache-2.0
#include "CGAdd.h"

#include <boost/make_shared.hpp>

#include "DaemonSession.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<CGAdd> CGAdd::New() {
    return boost::make_shared<CGAdd>();
}

CGAdd::CGAdd() {
    SetDescription("Add the LumoIds to Consistency Group");
    SetMetaDataField("type", "operation");
    openSession("CGAdd", 35);
}

CGAdd::~CGAdd() {
    closeSession();
}

InputSpecPtr CGAdd::GetInputSpecInternal() {
    return declareParameters({
        {"cgid", CallSpec::String, "c", true, "Consistency Group ID to which lumos are to be added"},
        {"lumoids", CallSpec::StringList, "v", true, "List of LumoIDs."},
        {"vp-name", CallSpec::String, "n", true, "Name of the VP which the Tovi is registered to."},
    });
}

OutputSpecPtr CGAdd::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void CGAdd::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    input->GetString("cgid");
    input->GetStringList("lumoids");
    input->GetString("vp-name");
    output->SetResult(MetaObj::MetaBool::New(true));
    output->Complete();
}

} // namespace TarselCli::LumoNamespace
