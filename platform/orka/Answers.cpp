// SPDX-License-Identifier: Apache-2.0
#include "Answers.h"

#include "VolumeRows.h"
#include "wire/Failure.h"

namespace Orka {

std::string requestText(std::string_view operation, std::initializer_list<std::string_view> arguments) {
    std::string text(operation);
    for (auto const argument : arguments) {
        // The length keeps ("a", "b c") and ("a b", "c") apart.
        text += ' ';
        text += std::to_string(argument.size());
        text += ':';
        text += argument;
    }
    return text;
}

std::optional<RememberedAnswer> recall(Sqlite::Database &database, std::string const &key, std::string const &request) {
    if (key.empty()) {
        return std::nullopt;
    }
    auto row = database.query("SELECT request, uuid, size_mb, block_size FROM answer WHERE idempotency_key = ?");
    row.bind(1, key);
    if (!row.step()) {
        return std::nullopt;
    }
    if (row.textView(0) != request) {
        throw Wire::Failure(Wire::ErrorCode::InvalidArgument,
                            "the idempotency key " + key + " was used for another request already");
    }
    RememberedAnswer answer;
    if (!row.isNull(1)) {
        answer.created = CreatedVolume{row.text(1), row.integer(2), row.integer(3)};
        requireId(database, answer.created->uuid, "the answer to an earlier request");
        if (answer.created->sizeMb <= 0 || answer.created->blockSize <= 0) {
            failDamaged(database, "the answer to an earlier request has sizes that cannot be");
        }
    }
    return answer;
}

void remember(Sqlite::Database &database, std::string const &key, std::string const &request,
              std::optional<CreatedVolume> const &created) {
    if (key.empty()) {
        return;
    }
    auto insert = database.query(
        "INSERT INTO answer (idempotency_key, request, uuid, size_mb, block_size) VALUES (?, ?, ?, ?, ?)");
    insert.bind(1, key).bind(2, request);
    if (created) {
        insert.bind(3, created->uuid).bind(4, created->sizeMb).bind(5, created->blockSize);
    }
    insert.run();
    auto forget = database.query("DELETE FROM answer WHERE seq <= ?");
    forget.bind(1, database.lastInsertId() - rememberedAnswers);
    forget.run();
}

} // namespace Orka
