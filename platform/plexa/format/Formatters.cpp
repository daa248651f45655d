// SPDX-License-Identifier: Apache-2.0
#include "plexa/Formatter.h"

#include "Formats.h"
#include "plexa/UsageError.h"

namespace Plexa {

namespace {

constexpr Format formats[] = {
    {"simple", false, writeSimple}, {"table", false, writeTable},      {"tree", false, writeTree},
    {"json", true, writeJson},      {"yaml", true, writeYaml},         {"xml", true, writeXml},
    {"csv", true, writeCsv},        {"keyvalue", true, writeKeyValue},
};

} // namespace

Format const *findFormat(std::string const &name) {
    for (Format const &format : formats) {
        if (name == format.name) {
            return &format;
        }
    }
    return nullptr;
}

std::string formatNames() {
    std::string names;
    for (Format const &format : formats) {
        names += names.empty() ? "" : ", ";
        names += format.name;
    }
    return names;
}

Format const &requireFormat(std::string const &name, std::string const &origin) {
    Format const *format = findFormat(name);
    if (format == nullptr) {
        std::vector<std::string> names;
        for (Format const &each : formats) {
            names.emplace_back(each.name);
        }
        throw UsageError(origin + ": unknown format " + shownWord(name) + didYouMean(nearNames(name, names)) +
                         "; there is " + formatNames());
    }
    return *format;
}

boost::shared_ptr<MetaObj::MetaStruct> outermostStructure(boost::shared_ptr<MetaObj::MetaObject> const &schema) {
    if (auto const list = boost::dynamic_pointer_cast<MetaObj::MetaList>(schema)) {
        return boost::dynamic_pointer_cast<MetaObj::MetaStruct>(list->GetElementSchema());
    }
    return boost::dynamic_pointer_cast<MetaObj::MetaStruct>(schema);
}

} // namespace Plexa
