// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <variant>

#include "Async.h"
#include "Call.h"
#include "Core.h"
#include "ReplySource.h"
#include "wire/lumod.capnp.h"

namespace Lumod {

/// Answers one kind of request. What it needs of the request it reads before it returns.
using Handler = Answer<ReplyPtr> (*)(Core &, CallPtr const &, Wire::Request::Reader);

/// Answers what needs nobody else, so that nothing has to be waited for. May throw a Wire::Failure.
using PromptHandler = ReplyPtr (*)(Core &, CallPtr const &, Wire::Request::Reader);

struct Method {
    Wire::Request::Which which;
    char const *name; ///< as in the schema
    std::variant<Handler, PromptHandler> handler;
    /// It only reads, so nobody misses it when the client goes away in the meantime.
    bool mayBeAbandoned;
};

/// @return null for a method that this daemon does not know
Method const *methodOf(Wire::Request::Reader request);

/// What has answered, or what is going to.
using Dispatched = std::variant<Outcome<ReplyPtr>, Answer<ReplyPtr>>;

/// Answers a request. Failures: UnsupportedVersion, UnknownMethod, InvalidRequest, and what the method fails with.
Dispatched dispatch(Core &core, CallPtr const &call, Wire::Request::Reader request);

} // namespace Lumod
