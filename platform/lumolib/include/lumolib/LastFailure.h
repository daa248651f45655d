/* SPDX-License-Identifier: Apache-2.0
 *
 * The last failure that a platform library met in this process, kept for the tool: a command may swallow a cause or
 * shorten it to a fixed text, and the tool prints it behind the command's own words. Every failing request notes
 * itself here; a request that succeeds leaves the note alone. The tool clears it before a command and looks afterwards.
 *
 * A platform of somebody else's may lack these functions: a tool that wants to run on one asks dlsym for them.
 */
#ifndef LUMOLIB_LASTFAILURE_H
#define LUMOLIB_LASTFAILURE_H

#include <stdbool.h>
#include <stdint.h>

#define LUMO_PLATFORM_EXPORT __attribute__((visibility("default")))

#ifdef __cplusplus
extern "C" {
#endif

/** What failed. The texts belong to the library and last until the next note or clear; none is null. */
typedef struct LumoLastFailure {
    int32_t code;          /* as LumoLib_Err2String takes it */
    char const *sentence;  /* a finished sentence for the user, with the particulars */
    char const *requestId; /* of the command in whose name it was asked (TOVI_REQUEST_ID), empty without one */
} LumoLastFailure;

/** @return false: nothing has failed since the last clear; out is then left as it was. */
LUMO_PLATFORM_EXPORT bool LumoPlatform_LastFailure(LumoLastFailure *out);
LUMO_PLATFORM_EXPORT void LumoPlatform_ClearLastFailure(void);
/** Replaces what was noted. Copies the sentence (cut at 2 KiB); allocates nothing. */
LUMO_PLATFORM_EXPORT void LumoPlatform_NoteFailure(int32_t code, char const *sentence);

#ifdef __cplusplus
}
#endif

#endif
