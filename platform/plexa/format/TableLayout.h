// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "ResultModel.h"

namespace Plexa {

struct Column {
    FieldPlan field;
    /// Of the widest cell or the title; less where the table is laid out to a terminal.
    std::size_t width = 0;
    bool isNumber = false;
};

/// Blanks between two columns.
constexpr std::size_t columnGap = 2;

/// Makes the widest columns narrower, down to 8 but never a number, until the table is at most room wide. A table that
/// is wider even then stays so.
void fitColumns(std::vector<Column> &columns, std::size_t room);

/// A text in lines of at most width columns: broken at blanks, a longer word anywhere. Expects what escaped() returned.
std::vector<std::string> brokenToWidth(std::string_view text, std::size_t width);

/// The structures of a list, or one alone.
class Rows {
public:
    explicit Rows(std::vector<Object> const &elements)
        : elements_(elements.data())
        , size_(elements.size()) {}
    explicit Rows(MetaObj::MetaStruct const &one)
        : one_(&one)
        , size_(1) {}
    std::size_t size() const {
        return size_;
    }
    MetaObj::MetaObject const *operator[](std::size_t place) const {
        return elements_ != nullptr ? elements_[place].get() : one_;
    }

private:
    Object const *elements_ = nullptr;
    MetaObj::MetaObject const *one_ = nullptr;
    std::size_t size_;
};

} // namespace Plexa
