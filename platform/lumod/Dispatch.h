// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>

#include "Async.h"
#include "Call.h"
#include "Core.h"
#include "ReplySource.h"
#include "wire/lumod.capnp.h"

namespace Lumod {

/// Answers one kind of request. What it needs of the request it reads before it returns.
using Handler = Answer<ReplyPtr> (*)(Core &, CallPtr const &, Wire::Request::Reader);

struct Method {
    Wire::Request::Which which;
    char const *name; ///< as in the schema
    Handler handler;
    /// It only reads, so nobody misses it when the client goes away in the meantime.
    bool mayBeAbandoned;
};

/// @return null for a method that this daemon does not know
Method const *methodOf(Wire::Request::Reader request);

/// Answers a request. Failures: UnsupportedVersion, UnknownMethod, InvalidRequest, and what the method fails with.
Answer<ReplyPtr> dispatch(Core &core, CallPtr const &call, Wire::Request::Reader request);

} // namespace Lumod
