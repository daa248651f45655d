// SPDX-License-Identifier: Apache-2.0
#include "CGDelete.h"

#include <boost/make_shared.hpp>

#include "DaemonSession.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<CGDelete> CGDelete::New() {
    return boost::make_shared<CGDelete>();
}

CGDelete::CGDelete() {
    SetDescription("Delete the Consistency Group");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
    openSession("CGDelete", 37);
}

CGDelete::~CGDelete() {
    closeSession();
}

InputSpecPtr CGDelete::GetInputSpecInternal() {
    return declareParameters({
        {"cgid", CallSpec::String, "c", true, "ID of Consistency Group to be deleted"},
        {"vp-name", CallSpec::String, "v", true, "Name of the VP"},
    });
}

OutputSpecPtr CGDelete::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaBool::New());
}

void CGDelete::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    input->GetString("cgid");
    input->GetString("vp-name");
    output->SetResult(MetaObj::MetaBool::New(true));
    output->Complete();
}

} // namespace TarselCli::LumoNamespace
