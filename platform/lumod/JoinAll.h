// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <optional>
#include <utility>
#include <vector>

#include <kj/array.h>
#include <kj/async.h>

namespace Lumod {

/// kj::joinPromises for promises of results. KJ makes the room for them when all have come, in a function that may not
/// throw: without memory that is the end of the daemon. Here it is made where the request alone fails.
template <typename T>
kj::Promise<kj::Array<T>> joinAll(kj::Array<kj::Promise<T>> promises) {
    auto results = std::make_unique<std::vector<std::optional<T>>>(promises.size());
    auto done = kj::heapArrayBuilder<kj::Promise<void>>(promises.size());
    for (std::size_t i = 0; i < promises.size(); ++i) {
        done.add(promises[i].then([result = &(*results)[i]](T &&value) { result->emplace(std::move(value)); }));
    }
    return kj::joinPromises(done.finish()).then([results = std::move(results)]() {
        auto all = kj::heapArrayBuilder<T>(results->size());
        for (std::optional<T> &result : *results) {
            all.add(std::move(*result));
        }
        return all.finish();
    });
}

} // namespace Lumod
