// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <utility>

#include <kj/async.h>

namespace Lumod {

/// The two steps in which the daemon ends: first it takes nothing new, then it gives up what is not done.
class Shutdown {
public:
    Shutdown()
        : Shutdown(kj::newPromiseAndFulfiller<void>(), kj::newPromiseAndFulfiller<void>()) {}

    void drain() {
        isDraining_ = true;
        drain_->fulfill();
    }
    void giveUp() {
        giveUp_->fulfill();
    }

    bool isDraining() const {
        return isDraining_;
    }
    kj::Promise<void> draining() {
        return draining_.addBranch();
    }
    kj::Promise<void> givingUp() {
        return givingUp_.addBranch();
    }

private:
    using Pair = kj::PromiseFulfillerPair<void>;
    Shutdown(Pair drain, Pair giveUp)
        : drain_(kj::mv(drain.fulfiller))
        , giveUp_(kj::mv(giveUp.fulfiller))
        , draining_(drain.promise.fork())
        , givingUp_(giveUp.promise.fork()) {}

    bool isDraining_ = false;
    kj::Own<kj::PromiseFulfiller<void>> drain_;
    kj::Own<kj::PromiseFulfiller<void>> giveUp_;
    kj::ForkedPromise<void> draining_;
    kj::ForkedPromise<void> givingUp_;
};

} // namespace Lumod
