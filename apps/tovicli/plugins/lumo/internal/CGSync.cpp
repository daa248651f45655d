// SPDX-License-Identifier: Apache-2.0
#include "CGSync.h"

#include <boost/make_shared.hpp>

#include "ConsistencyGroups.h"
#include "DaemonSession.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<CGSync> CGSync::New() {
    return boost::make_shared<CGSync>();
}

CGSync::CGSync() {
    SetDescription("Sync Consistency Group IDs.");
    SetMetaDataField("type", "operation");
    SetDefaultOutputFormatter("simple");
    SetDefaultOutputParameter("header:CgSync", "%CgId%");
    SetDefaultOutputParameter("fields:CGSync", "CgId,RpId,TimeStamp,Warning,Error");
    openSession("CGSync", 52);
}

CGSync::~CGSync() {
    closeSession();
}

InputSpecPtr CGSync::GetInputSpecInternal() {
    return declareParameters({
        {"cgid", CallSpec::StringList, "c", true, "List of CG IDs."},
        {"vp-name", CallSpec::String, "n", true, "Name of the VP which Host is registered."},
    });
}

OutputSpecPtr CGSync::GetOutputSpecInternal() {
    return declareResult(makeStructList(GetOutputStructure()));
}

StructPtr CGSync::GetOutputStructure() {
    StructPtr const group = MetaObj::MetaStruct::New("CGSync");
    group->SetField("CgId", MetaObj::MetaString::New());
    group->SetField("RpId", MetaObj::MetaString::New());
    group->SetField("TimeStamp", MetaObj::MetaString::New());
    group->SetField("Warning", MetaObj::MetaString::New());
    group->SetField("Error", MetaObj::MetaString::New());
    return group;
}

void CGSync::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    answerNoGroups(input, output, GetOutputStructure());
}

} // namespace TarselCli::LumoNamespace
