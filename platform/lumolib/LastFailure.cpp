// SPDX-License-Identifier: Apache-2.0
#include "lumolib/LastFailure.h"

#include <cstdint>
#include <cstdlib>
#include <cstring>

#include "TextCut.h"

namespace {

/// Fixed room: also a program that is out of memory can tell why it failed. All zero, so it costs nothing at start.
struct Note {
    bool noted;
    std::int32_t code;
    char sentence[2048];
    char requestId[128];
};

Note note;

} // namespace

bool LumoPlatform_LastFailure(LumoLastFailure *out) {
    if (out == nullptr || !note.noted) {
        return false;
    }
    *out = LumoLastFailure{note.code, note.sentence, note.requestId};
    return true;
}

void LumoPlatform_ClearLastFailure(void) {
    note.noted = false;
}

void LumoPlatform_NoteFailure(int32_t code, char const *sentence) {
    note.noted = true;
    note.code = code;
    LumoClient::copyCut(note.sentence, sizeof note.sentence, sentence);
    LumoClient::copyCut(note.requestId, sizeof note.requestId, std::getenv("TOVI_REQUEST_ID"));
}
