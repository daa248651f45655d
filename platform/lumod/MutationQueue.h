// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <deque>
#include <memory>
#include <utility>

#include <kj/async.h>

#include "Async.h"

namespace Lumod {

/// First come, first served: changes of volumes take their turn one after the other. A request that is dropped while it
/// waits leaves the queue; one that is dropped during its turn ends it.
class MutationQueue {
    struct State;

public:
    /// Whoever holds it is having his turn.
    class Turn {
    public:
        explicit Turn(std::shared_ptr<State> state)
            : state_(std::move(state)) {}
        Turn(Turn &&) noexcept = default;
        Turn &operator=(Turn &&) = delete;
        ~Turn() {
            if (state_) {
                state_->passOn();
            }
        }

    private:
        std::shared_ptr<State> state_;
    };

    kj::Promise<Turn> wait() {
        if (!state_->taken) {
            state_->taken = true;
            return Turn(state_);
        }
        auto pair = kj::newPromiseAndFulfiller<Turn>();
        state_->waiting.push_back(kj::mv(pair.fulfiller));
        return kj::mv(pair.promise);
    }

    /// Runs a function in its turn. It returns an Answer, which ends the turn.
    template <typename Function>
    auto inTurn(Function function) -> decltype(function()) {
        return wait().then([function = std::move(function)](Turn &&turn) mutable {
            auto held = kj::heap<Turn>(kj::mv(turn));
            return function().attach(kj::mv(held));
        });
    }

    bool isBusy() const {
        return state_->taken;
    }
    /// Those that wait, and those that gave up but stand in the queue still.
    std::size_t length() const {
        return state_->waiting.size();
    }

private:
    struct State : std::enable_shared_from_this<State> {
        bool taken = false;
        std::deque<kj::Own<kj::PromiseFulfiller<Turn>>> waiting;

        void passOn() {
            while (!waiting.empty()) {
                kj::Own<kj::PromiseFulfiller<Turn>> next = kj::mv(waiting.front());
                waiting.pop_front();
                if (next->isWaiting()) {
                    next->fulfill(Turn(shared_from_this()));
                    return;
                }
            }
            taken = false;
        }
    };

    std::shared_ptr<State> state_ = std::make_shared<State>();
};

} // namespace Lumod
