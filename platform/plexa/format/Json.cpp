// SPDX-License-Identifier: Apache-2.0
#include "Formats.h"
#include "JsonWriter.h"
#include "TextBuffer.h"

namespace Plexa {

void writeJson(Result const &result, FormatSettings const &settings, Sink &sink) {
    TextBuffer out(sink);
    JsonWriter<TextBuffer, JsonLayout::Lines> writer(out);
    MachineWalk("json", settings, writer).result(result);
    out.put('\n');
}

} // namespace Plexa
