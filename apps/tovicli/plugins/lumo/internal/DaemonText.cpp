// SPDX-License-Identifier: Apache-2.0
#include "DaemonText.h"

#include <sstream>

#include "lumolib/LumoLib.h"

namespace TarselCli::LumoNamespace {

std::string textOrEmpty(char const *text) {
    return text == nullptr ? std::string() : std::string(text);
}

void writeText(std::ostream &stream, char const *text) {
    if (text == nullptr) {
        stream.setstate(std::ios_base::badbit);
    } else {
        stream << text;
    }
}

std::string failureText(char const *prefix, int32_t code) {
    std::ostringstream text;
    text << prefix;
    writeText(text, LumoLib_Err2String(code));
    text << std::endl;
    return text.str();
}

bool reportOutcome(OutputPtr const &output, char const *prefix, int32_t code) {
    if (code == 0) {
        output->SetResult(Plexa::MetaObj::MetaBool::New(true));
    } else {
        output->SetMessage(failureText(prefix, code));
    }
    return code == 0;
}

} // namespace TarselCli::LumoNamespace
