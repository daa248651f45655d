// SPDX-License-Identifier: Apache-2.0
#include <iostream>

#include "Run.h"

int main(int argc, char **argv) {
    // argc is 0 when the caller passed no name either.
    Orkasim::Words const words(argv + (argc > 0 ? 1 : 0), argv + argc);
    return static_cast<int>(Orkasim::run(words, {std::cin, std::cout, std::cerr}));
}
