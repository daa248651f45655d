// SPDX-License-Identifier: Apache-2.0
//
// The provider protocol's constants; docs/provider-protocol.md tells its implementers what they mean.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

#include "wire/ErrorCode.h"

namespace Orka::Https {

/// Stands in the path of every operation: BASE/v1/queryStorageArray.
inline constexpr std::string_view versionSegment = "/v1/";

/// Bytes of a request's body; a server refuses more.
inline constexpr std::size_t requestBytesMax = std::size_t{1} << 20;
/// Bytes of an answer's body; a client reads no more.
inline constexpr std::size_t answerBytesMax = std::size_t{16} << 20;
/// Elements of a page, and about this many bytes, whichever comes first.
inline constexpr int64_t pageItemsMax = 1000;
inline constexpr std::size_t pageBytesMax = std::size_t{1} << 20;
/// Elements of a whole list; a client gives up on a provider that tells more.
inline constexpr std::size_t listItemsMax = 1000000;
/// Ids in one queryVirtualVolumesById.
inline constexpr std::size_t idsPerRequestMax = 1000;

inline constexpr char const *jsonType = "application/json";

/// HTTP statuses that the protocol speaks of.
inline constexpr unsigned statusDone = 200;
inline constexpr unsigned statusBadRequest = 400;
inline constexpr unsigned statusForbidden = 403;
inline constexpr unsigned statusNotFound = 404;
inline constexpr unsigned statusMethodNotAllowed = 405;
inline constexpr unsigned statusConflict = 409;
inline constexpr unsigned statusTooLarge = 413;
inline constexpr unsigned statusUnsupportedMediaType = 415;
inline constexpr unsigned statusTooManyRequests = 429;
inline constexpr unsigned statusBroken = 500;
inline constexpr unsigned statusNotImplemented = 501;
inline constexpr unsigned statusBadGateway = 502;
inline constexpr unsigned statusUnavailable = 503;
inline constexpr unsigned statusGatewayTimeout = 504;

/// A page token that the server does not know any more; the client begins the list anew.
inline constexpr std::string_view stalePage = "stalePage";
/// What a server says that has no such version, or whose version has no such operation.
inline constexpr std::string_view unknownVersion = "unknownVersion";
inline constexpr std::string_view unknownOperation = "unknownOperation";

/// What an answer with an error may name as its code.
struct ErrorName {
    std::string_view name;
    Wire::ErrorCode code;
    unsigned status;
};

/// By its name; nothing for a name that is not in the protocol.
ErrorName const *errorNamed(std::string_view name);
/// The name for a code; codes without one of their own are an arrayFailure.
ErrorName const &nameOf(Wire::ErrorCode code);

} // namespace Orka::Https
