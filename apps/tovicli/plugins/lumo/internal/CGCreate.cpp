// SPDX-License-Identifier: Apache-2.0
#include "CGCreate.h"

#include <boost/make_shared.hpp>

#include "DaemonSession.h"
#include "lumolib/LumoLib.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<CGCreate> CGCreate::New() {
    return boost::make_shared<CGCreate>();
}

CGCreate::CGCreate() {
    SetDescription("Create a Consistency Group.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter("fields:GCreate",
                              "Name,Description,Id,DestinationArrayId,FailoverArrayId,SourceArrayId,State");
    openSession("CGCreate", 47);
}

CGCreate::~CGCreate() {
    closeSession();
}

InputSpecPtr CGCreate::GetInputSpecInternal() {
    return declareParameters({
        {"name", CallSpec::String, "n", true, "Consistency Group Name"},
        {"desc", CallSpec::String, "d", true, "Consistency Group Description"},
        {"profile", CallSpec::String, "p", true, "Profile ID as advertised by VP"},
        {"vp-name", CallSpec::String, "v", true, "Name of the VP which Tovi host is registered to"},
    });
}

OutputSpecPtr CGCreate::GetOutputSpecInternal() {
    return declareResult(GetOutputStructure());
}

StructPtr CGCreate::GetOutputStructure() {
    StructPtr const group = MetaObj::MetaStruct::New("CGCreate");
    group->SetField("Name", MetaObj::MetaString::New());
    group->SetField("Description", MetaObj::MetaString::New());
    group->SetField("Id", MetaObj::MetaString::New());
    group->SetField("DestinationArrayId", MetaObj::MetaString::New());
    group->SetField("FailoverArrayId", MetaObj::MetaString::New());
    group->SetField("SourceArrayId", MetaObj::MetaString::New());
    group->SetField("State", MetaObj::MetaString::New());
    return group;
}

void CGCreate::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    input->GetString("name");
    input->GetString("desc");
    input->GetString("profile");
    input->GetString("vp-name");
    // This session stays with the process; the destructor closes the constructor's.
    if (!LumoLib_Init(0, 0)) {
        output->SetMessage("Failed to initialize LumoLib");
        return;
    }
    StructPtr const group = GetOutputStructure();
    for (std::string const &field : group->GetFieldNames()) {
        group->SetField(field, "");
    }
    output->SetResult(group);
    output->Complete();
}

} // namespace TarselCli::LumoNamespace
