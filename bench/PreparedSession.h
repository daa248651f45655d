// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <capnp/message.h>
#include <functional>

#include "RawSession.h"
#include "wire/lumod.capnp.h"

namespace Bench {

/// A raw session whose requests are made, and whose first replies are understood, by the Cap'n Proto library. For
/// programs that measure inside one process, and for those that record what a floor sends.
class PreparedSession : public RawSession {
public:
    using RawSession::RawSession;

    using Fill = std::function<void(Wire::Request::Builder)>;
    using Look = std::function<void(Wire::Reply::Reader)>;

    /// What ask() sends from now on. Asks once, reading the replies with care, to learn how many there are.
    /// @return the bytes read
    size_t prepare(Fill const &fill, Look const &look = {});
    /// Sends another request and waits for nothing.
    void begin(Fill const &fill);
};

} // namespace Bench
