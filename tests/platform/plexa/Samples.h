// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "plexa/Formatter.h"

/// A list of containers with their arrays, in the shape that commands build, and its schema.
namespace Samples {

using Plexa::MetaObj::MetaBool;
using Plexa::MetaObj::MetaInt;
using Plexa::MetaObj::MetaList;
using Plexa::MetaObj::MetaString;
using Plexa::MetaObj::MetaStruct;

inline boost::shared_ptr<MetaStruct> arraySchema() {
    auto const schema = MetaStruct::New("Array");
    schema->SetField("ArrayId", MetaString::New());
    schema->SetField("Name", MetaString::New());
    schema->SetField("PEInfo", MetaList::New(Plexa::MetaObj::StringList));
    return schema;
}

inline boost::shared_ptr<MetaStruct> containerSchema() {
    auto const schema = MetaStruct::New("Container");
    schema->SetField("Container Name", MetaString::New());
    schema->SetField("Max Size", MetaInt::New());
    schema->SetField("Ready", MetaBool::New());
    schema->SetField("Arrays", MetaList::New(Plexa::MetaObj::StructList, arraySchema()));
    return schema;
}

inline boost::shared_ptr<MetaStruct> array(std::string const &id, std::vector<std::string> const &endpoints) {
    auto const made = arraySchema();
    made->SetField("ArrayId", id);
    made->SetField("Name", "Lab " + id);
    made->SetField("PEInfo", endpoints);
    return made;
}

inline boost::shared_ptr<MetaStruct> container(std::string const &name, int64_t size,
                                               std::vector<boost::shared_ptr<MetaStruct>> const &arrays) {
    auto const made = containerSchema();
    made->SetField("Container Name", name);
    made->SetField("Max Size", size);
    made->SetField("Ready", true);
    auto const list = MetaList::New(Plexa::MetaObj::StructList, arraySchema());
    for (auto const &each : arrays) {
        list->Append(each);
    }
    made->SetField("Arrays", list);
    return made;
}

inline boost::shared_ptr<MetaList> containersSchema() {
    return MetaList::New(Plexa::MetaObj::StructList, containerSchema());
}

inline Plexa::Result containers(std::vector<boost::shared_ptr<MetaStruct>> const &elements) {
    auto const list = containersSchema();
    for (auto const &element : elements) {
        list->Append(element);
    }
    return {list, containersSchema()};
}

inline Plexa::Result twoContainers() {
    return containers({container("gold", 4096, {array("a-1", {"PE #0", "PE #1"}), array("a-2", {})}),
                       container("silver", 65536, {})});
}

inline std::string format(std::string const &name, Plexa::Result const &result,
                          Plexa::FormatSettings const &settings = {}) {
    Plexa::StringSink sink;
    Plexa::requireFormat(name, "--format").write(result, settings, sink);
    return sink.text();
}

inline Plexa::FormatSettings settings(std::vector<std::pair<std::string, std::string>> const &pairs) {
    Plexa::FormatSettings made;
    for (auto const &pair : pairs) {
        made.set(pair.first, pair.second);
    }
    return made;
}

} // namespace Samples
