// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>

#include "sqlite/Database.h"

namespace Orka {

/// How many keys a file remembers. A retry comes within seconds; the oldest keys are forgotten.
inline constexpr int64_t rememberedAnswers = 10000;

/// A mutation and its arguments as one text that no other mutation has.
std::string requestText(std::string_view operation, std::initializer_list<std::string_view> arguments);

/// What a volume's making was answered with, beyond what was asked for.
struct CreatedVolume {
    std::string uuid;
    int64_t sizeMb = 0;
    int64_t blockSize = 0;
};

/// An answer that was given before; `created` for the making of a volume.
struct RememberedAnswer {
    std::optional<CreatedVolume> created;
};

/// Looks a key up; an empty key is never found.
/// @throws Wire::Failure InvalidArgument when the key stands for another request.
std::optional<RememberedAnswer> recall(Sqlite::Database &database, std::string const &key, std::string const &request);

/// Keeps an answer within the transaction that does what it tells. An empty key is not kept.
void remember(Sqlite::Database &database, std::string const &key, std::string const &request,
              std::optional<CreatedVolume> const &created);

} // namespace Orka
