/* SPDX-License-Identifier: Apache-2.0
 *
 * Each request to the daemon, told to the tool when it is over: the tool shows it to a user who wants to know
 * everything (--log-level trivia). While nobody listens, a request costs one look at a pointer.
 *
 * A platform of somebody else's may lack this function: a tool that wants to run on one asks dlsym for it.
 */
#ifndef LUMOLIB_TRACE_H
#define LUMOLIB_TRACE_H

#include <stdint.h>

#define LUMO_TRACE_EXPORT __attribute__((visibility("default")))

#ifdef __cplusplus
extern "C" {
#endif

/** One request and its whole answer. The texts are the library's and last for the call; none is null. */
typedef struct LumoRequestTrace {
    char const *method;     /* as the daemon's log names it */
    char const *requestId;  /* of the command in whose name it was asked, as in the daemon's log; may be empty */
    char const *socketPath; /* whom it was asked */
    uint64_t sentBytes;
    uint64_t receivedBytes;
    uint32_t replies; /* messages that the answer came in */
    int32_t code;     /* 0: answered; else as LumoLib_Err2String takes it */
    uint64_t microseconds;
} LumoRequestTrace;

typedef void (*LumoTraceReceiver)(void *context, LumoRequestTrace const *request);

/** From now on every request is told to the receiver, on the thread that asked; null ends it. One receiver a process.
 * The receiver must not throw, and must not ask the daemon anything. */
LUMO_TRACE_EXPORT void LumoPlatform_TraceRequests(LumoTraceReceiver receiver, void *context);

#ifdef __cplusplus
}
#endif

#endif
