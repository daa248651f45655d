// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <exception>
#include <string>
#include <utility>

namespace Sqlite {

enum class ErrorKind {
    Missing,    ///< there is no such file, or one without content
    Malformed,  ///< no database, damaged, or an unfinished layout
    Foreign,    ///< a database of another program
    Newer,      ///< written by a newer version of ours
    Busy,       ///< another process held its lock for longer than the busy timeout
    ReadOnly,   ///< the file, its directory or the handle cannot be written
    DiskFull,   ///< no space left; the transaction is rolled back
    Io,         ///< the operating system failed to read, write, sync or open
    Constraint, ///< a row breaks a rule of the schema (a key that exists already, a reference to nothing)
    Other,      ///< a statement that does not fit the schema, or memory that ran out
};

/// What every operation of this folder throws. The sentence is finished, for the user, and names the file.
class Error : public std::exception {
public:
    Error(ErrorKind kind, std::string sentence)
        : kind_(kind)
        , sentence_(std::move(sentence)) {}
    ErrorKind kind() const noexcept {
        return kind_;
    }
    std::string const &sentence() const noexcept {
        return sentence_;
    }
    char const *what() const noexcept override {
        return sentence_.c_str();
    }

private:
    ErrorKind kind_;
    std::string sentence_;
};

} // namespace Sqlite
