// SPDX-License-Identifier: Apache-2.0
#include "https/Protocol.h"

#include <algorithm>
#include <array>

namespace Orka::Https {

namespace {

using Wire::ErrorCode;

constexpr std::array<ErrorName, 13> names{{
    {"arrayFailure", ErrorCode::IoError, statusBroken},
    {"invalidArgument", ErrorCode::InvalidArgument, statusBadRequest},
    {"noSuchContainer", ErrorCode::NoSuchContainer, statusNotFound},
    {"noSuchVolume", ErrorCode::NoSuchVolume, statusNotFound},
    {"noSuchEndpoint", ErrorCode::NoSuchEndpoint, statusNotFound},
    {"alreadyExists", ErrorCode::AlreadyExists, statusConflict},
    {"inUse", ErrorCode::InUse, statusConflict},
    {"tooLarge", ErrorCode::TooLarge, statusBadRequest},
    {"noAccessibleEndpoint", ErrorCode::NoAccessibleEndpoint, statusConflict},
    {"busy", ErrorCode::ProviderBusy, statusUnavailable},
    {"deadlineExceeded", ErrorCode::DeadlineExceeded, statusGatewayTimeout},
    {"notPermitted", ErrorCode::NotPermitted, statusForbidden},
    {unknownOperation, ErrorCode::UnknownOperation, statusNotFound},
}};

} // namespace

ErrorName const *errorNamed(std::string_view name) {
    auto const found = std::find_if(names.begin(), names.end(), [&](auto const &entry) { return entry.name == name; });
    return found == names.end() ? nullptr : &*found;
}

ErrorName const &nameOf(ErrorCode code) {
    auto const found = std::find_if(names.begin(), names.end(), [&](auto const &entry) { return entry.code == code; });
    return found == names.end() ? names.front() : *found;
}

} // namespace Orka::Https
