/* SPDX-License-Identifier: Apache-2.0
 *
 * How far a long call has come, kept for the tool: the platform's libraries count, the tool shows it beside the time
 * while a command runs. Counting costs two stores, so it is always done, whether somebody looks or not.
 *
 * A platform of somebody else's may lack these functions: a tool that wants to run on one asks dlsym for them.
 */
#ifndef LUMOLIB_PROGRESS_H
#define LUMOLIB_PROGRESS_H

#include <stdbool.h>
#include <stdint.h>

#define LUMO_PROGRESS_EXPORT __attribute__((visibility("default")))

#ifdef __cplusplus
extern "C" {
#endif

/** What was counted last. May be called in a signal handler, on any thread.
 * @param total 0 when nobody knows how many there will be
 * @return false: nothing has been counted since the last clear; the parameters are then left as they were */
LUMO_PROGRESS_EXPORT bool LumoPlatform_Progress(uint64_t *done, uint64_t *total);
/** Replaces what was counted; 0 of 0 clears it. */
LUMO_PROGRESS_EXPORT void LumoPlatform_NoteProgress(uint64_t done, uint64_t total);
/** One more is done. Counts nothing while no total is known. */
LUMO_PROGRESS_EXPORT void LumoPlatform_NoteOneDone(void);
/** That many need not be done after all, because they were done before. Never takes the total to 0. */
LUMO_PROGRESS_EXPORT void LumoPlatform_NoteNotNeeded(uint64_t count);

#ifdef __cplusplus
}
#endif

#endif
