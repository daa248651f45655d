// SPDX-License-Identifier: Apache-2.0
//
// What a server keeps of lists whose pages somebody may still ask for.
#include "https/HeldLists.h"

#include <algorithm>
#include <string>

#include <gtest/gtest.h>

using Orka::Https::HeldLists;

namespace {

std::shared_ptr<std::vector<int> const> numbers(int first, std::size_t count) {
    auto items = std::make_shared<std::vector<int>>();
    for (std::size_t index = 0; index < count; ++index) {
        items->push_back(first + static_cast<int>(index));
    }
    return items;
}

/// A page is told as "FIRST:COUNT".
template <typename T>
void hold(HeldLists &lists, std::string const &token, std::shared_ptr<std::vector<T> const> items) {
    lists.hold(token, std::move(items), [](std::shared_ptr<std::vector<T> const> kept) {
        return [kept = std::move(kept)](std::size_t offset, std::size_t most) {
            return std::to_string(static_cast<int>(kept->at(offset))) + ':' +
                   std::to_string(std::min(most, kept->size() - offset));
        };
    });
}

std::string page(HeldLists &lists, std::string const &token, std::size_t offset = 0, std::size_t most = 10) {
    auto const *const pages = lists.find(token);
    return pages == nullptr ? "none" : (*pages)(offset, most);
}

} // namespace

TEST(HeldLists, keepTheSameContentOnceHoweverManyAsk) {
    HeldLists lists({1000, 100});
    for (int count = 0; count < 500; ++count) {
        hold(lists, "even" + std::to_string(count), numbers(0, 40));
        hold(lists, "odd" + std::to_string(count), numbers(1, 40));
    }
    EXPECT_EQ(lists.elements(), 80U);
    EXPECT_EQ(page(lists, "even0", 5), "5:10");
    EXPECT_EQ(page(lists, "odd499", 38), "39:2");
}

TEST(HeldLists, tellListsOfOneSizeButAnotherTypeApart) {
    HeldLists lists({10, 100});
    hold(lists, "numbers", numbers(7, 3));
    hold<char>(lists, "letters", std::make_shared<std::vector<char> const>(std::vector<char>{7, 8, 9}));
    EXPECT_EQ(lists.elements(), 6U);
    EXPECT_EQ(page(lists, "letters", 1), "8:2");
}

TEST(HeldLists, forgetWhatWasNotAskedForTheLongest) {
    HeldLists lists({3, 100});
    for (int first : {1, 2, 3}) {
        hold(lists, std::to_string(first), numbers(first, 10));
    }
    EXPECT_EQ(page(lists, "1"), "1:10");
    hold(lists, "4", numbers(4, 10));
    EXPECT_EQ(page(lists, "2"), "none");
    EXPECT_EQ(page(lists, "1"), "1:10");
    EXPECT_EQ(lists.elements(), 30U);
}

TEST(HeldLists, areBoundByTheirElementsAndHoldOneListHoweverLong) {
    HeldLists lists({100, 25});
    hold(lists, "a", numbers(0, 10));
    hold(lists, "b", numbers(1, 10));
    hold(lists, "b2", numbers(1, 10));
    hold(lists, "c", numbers(2, 10));
    EXPECT_EQ(page(lists, "a"), "none");
    EXPECT_EQ(page(lists, "b"), "1:10");
    EXPECT_EQ(lists.elements(), 20U);
    hold(lists, "long", numbers(0, 1000));
    EXPECT_EQ(page(lists, "b2"), "none");
    EXPECT_EQ(page(lists, "long", 999), "999:1");
    EXPECT_EQ(lists.elements(), 1000U);
}
