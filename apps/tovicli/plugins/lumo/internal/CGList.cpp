// SPDX-License-Identifier: Apache-2.0
#include "CGList.h"

#include <boost/make_shared.hpp>

#include "ConsistencyGroups.h"

using namespace Plexa;

namespace TarselCli::LumoNamespace {

boost::shared_ptr<CGList> CGList::New() {
    return boost::make_shared<CGList>();
}

CGList::CGList() {
    SetDescription("List Consistency Group IDs.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("table");
    SetDefaultOutputParameter(
        "fields:CGList", "CgId,Name,Description,DestinationArrayId,FailOverArrayId,SourceArrayId,State,Warning,Error");
}

InputSpecPtr CGList::GetInputSpecInternal() {
    return declareParameters({
        {"cgid", CallSpec::StringList, "c", true, "List of CG IDs."},
        {"vp-name", CallSpec::String, "n", true, "Name of the VP which Tovi is registered."},
    });
}

OutputSpecPtr CGList::GetOutputSpecInternal() {
    return declareResult(makeStructList(GetOutputStructure()));
}

StructPtr CGList::GetOutputStructure() {
    StructPtr const group = MetaObj::MetaStruct::New("CGList");
    group->SetField("CgId", MetaObj::MetaString::New());
    group->SetField("Name", MetaObj::MetaString::New());
    group->SetField("Description", MetaObj::MetaString::New());
    group->SetField("DestinationArrayId", MetaObj::MetaString::New());
    group->SetField("FailOverArrayId", MetaObj::MetaString::New());
    group->SetField("SourceArrayId", MetaObj::MetaString::New());
    group->SetField("State", MetaObj::MetaString::New());
    group->SetField("Warning", MetaObj::MetaString::New());
    group->SetField("Error", MetaObj::MetaString::New());
    return group;
}

void CGList::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    answerNoGroups(input, output, GetOutputStructure());
}

} // namespace TarselCli::LumoNamespace
