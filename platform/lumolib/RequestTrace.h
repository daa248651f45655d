// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <cstdint>
#include <string>

#include "wire/ErrorCode.h"

namespace LumoClient {

/// What one request and its answer moved; counted whether somebody listens or not.
struct Traffic {
    std::uint16_t method = 0; ///< the request's place in the schema's union
    std::uint64_t sentBytes = 0;
    std::uint64_t receivedBytes = 0;
    std::uint32_t replies = 0;
};

/// The method of a place in the request's union, as the daemon's log names it.
char const *methodName(std::uint16_t place) noexcept;

/// Tells the tool about one request when it goes out of scope: lumolib/Trace.h. Everything referred to must outlive it.
class RequestTrace {
public:
    RequestTrace(std::string const &socketPath, std::string const &requestId, Traffic const &traffic);
    ~RequestTrace();
    RequestTrace(RequestTrace const &) = delete;
    RequestTrace &operator=(RequestTrace const &) = delete;

    void failed(Wire::ErrorCode code) {
        code_ = code;
    }

private:
    std::string const &socketPath_;
    std::string const &requestId_;
    Traffic const &traffic_;
    Wire::ErrorCode code_ = Wire::ErrorCode::Success;
    std::chrono::steady_clock::time_point started_;
};

} // namespace LumoClient
