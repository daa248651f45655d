// SPDX-License-Identifier: Apache-2.0
#include "Session.h"

#include <cstring>
#include <memory>
#include <new>

#include "TextCut.h"
#include "lumolib/LastFailure.h"
#include "wire/ContainerId.h"
#include "wire/ErrorCode.h"
#include "wire/Paths.h"

namespace LumoClient {

namespace {

/// A plain pointer: sessions that a program leaves open outlive its static objects, whose destructors may still call.
Connection *session = nullptr;
unsigned opens = 0;

std::int32_t noted(Wire::ErrorCode code, char const *sentence) noexcept {
    LumoPlatform_NoteFailure(static_cast<std::int32_t>(code), sentence);
    return static_cast<std::int32_t>(code);
}

/// The one place where exceptions end.
std::int32_t attempt(FunctionRef<void()> work) noexcept {
    try {
        work();
        return 0;
    } catch (Wire::Failure const &failure) {
        return noted(failure.code(), failure.sentence().c_str());
    } catch (std::bad_alloc const &) {
        return noted(Wire::ErrorCode::OutOfMemory, "out of memory");
    } catch (std::exception const &exception) {
        return noted(Wire::ErrorCode::InternalError, exception.what());
    } catch (...) {
        return noted(Wire::ErrorCode::InternalError, "internal error");
    }
}

Connection &openSession() {
    if (session == nullptr) {
        throw Wire::Failure(Wire::ErrorCode::NoSession, "no session with the daemon is open");
    }
    return *session;
}

/// Nested opens share one connection, and each one tells whether a daemon is there. Should the tool have gone to
/// another root, offline or back while somebody's session is still open, that session goes with it.
void open() {
    Settings const settings = Settings::fromEnvironment();
    std::string const socketPath = Wire::Paths(settings.root).orderedSocket();
    std::unique_ptr<Connection> fresh;
    if (session == nullptr || !session->serves(socketPath, settings)) {
        fresh = std::make_unique<Connection>(socketPath, settings);
    }
    Connection &connection = fresh ? *fresh : *session;
    if (!settings.offline) {
        connection.connect(connection.deadline());
    }
    if (fresh) {
        delete session;
        session = fresh.release();
    }
}

} // namespace

std::int32_t answer(FunctionRef<void(Connection &)> work) noexcept {
    return attempt([&work] { work(openSession()); });
}

LumoErrorEx answerEx(FunctionRef<void(Connection &)> work) noexcept {
    LumoErrorEx error{};
    error.code = answer(work);
    LumoLastFailure failure{};
    if (error.code != 0 && LumoPlatform_LastFailure(&failure)) {
        copyCut(error.text, sizeof error.text, failure.sentence);
    } else {
        copyCut(error.text, sizeof error.text, Wire::textOf(error.code));
    }
    return error;
}

std::string_view argument(char const *text) {
    return text != nullptr ? std::string_view(text) : std::string_view();
}

std::string canonicalContainerId(char const *text) {
    std::string const given = text != nullptr ? text : "";
    std::optional<std::string> canonical = Wire::normalizeContainerId(given);
    if (!canonical) {
        throw Wire::Failure(Wire::ErrorCode::InvalidArgument, "'" + given + "' is no container id");
    }
    return *canonical;
}

void requireOut(void const *out) {
    if (out == nullptr) {
        throw Wire::Failure(Wire::ErrorCode::InvalidArgument, "no place for a result was given");
    }
}

} // namespace LumoClient

using namespace LumoClient;

bool LumoLib_Init(int, int) {
    if (attempt([] { open(); }) != 0) {
        return false;
    }
    ++opens;
    return true;
}

void LumoLib_Exit(void) {
    if (opens > 0 && --opens == 0) {
        delete session;
        session = nullptr;
    }
}

char const *LumoLib_Err2String(int32_t code) {
    return Wire::textOf(code);
}

bool LumoLib_ErrorExIsSuccess(LumoErrorEx const *error) {
    return error != nullptr && error->code == 0;
}

char const *LumoLib_ErrorExStr(LumoErrorEx const *error) {
    return error != nullptr ? error->text : "";
}

bool LumoLib_NormalizeContainerIdString(char const *text, char *buffer37) {
    if (buffer37 == nullptr) {
        return false;
    }
    buffer37[0] = '\0';
    try {
        std::optional<std::string> const canonical = Wire::normalizeContainerId(text != nullptr ? text : "");
        if (canonical) {
            std::memcpy(buffer37, canonical->c_str(), canonical->size() + 1);
        }
        return canonical.has_value();
    } catch (std::bad_alloc const &) {
        return false;
    }
}
