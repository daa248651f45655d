// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

#include "lumolib/LumoLib.h"
#include "wire/ErrorCode.h"
#include "wire/Paths.h"

#include <gtest/gtest.h>

namespace LumoTest {

/// A root directory of its own for each test, named by the environment, with a run directory and no daemon. Sessions
/// that a test leaves open are closed.
class Host : public testing::Test {
protected:
    Host();
    ~Host() override;

    Wire::Paths const &paths() const {
        return paths_;
    }
    std::string socket() const {
        return paths_.orderedSocket();
    }
    /// For sessions and clients made from now on.
    static void set(char const *variable, std::string const &value);

    static constexpr char const *containerId = "0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9";
    static constexpr char const *volumeId = "11111111-2222-3333-4444-555555555555";

private:
    Wire::Paths paths_;
};

/// What LumoPlatform_LastFailure tells, as "code: sentence", or "none".
std::string lastFailure();

constexpr std::int32_t code(Wire::ErrorCode errorCode) {
    return static_cast<std::int32_t>(errorCode);
}

} // namespace LumoTest
