// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <type_traits>
#include <utility>

namespace LumoClient {

template <typename Signature>
class FunctionRef;

/// Something to call, for the time of a call: neither copied nor owned, and nothing is allocated for it. Only for
/// parameters, since a temporary that it was made from is gone after the full expression.
template <typename Result, typename... Arguments>
class FunctionRef<Result(Arguments...)> {
public:
    template <typename Function>
    // A lambda is handed over as it is; a copy of this class is no Function.
    // NOLINTNEXTLINE(bugprone-forwarding-reference-overload)
    requires(!std::is_same_v<std::remove_cvref_t<Function>, FunctionRef>) FunctionRef(Function &&function)
        : function_(const_cast<void *>(static_cast<void const *>(std::addressof(function))))
        , call_([](void *place, Arguments... arguments) -> Result {
            return (*static_cast<std::remove_reference_t<Function> *>(place))(std::forward<Arguments>(arguments)...);
        }) {}

    Result operator()(Arguments... arguments) const {
        return call_(function_, std::forward<Arguments>(arguments)...);
    }

private:
    void *function_;
    Result (*call_)(void *, Arguments...);
};

} // namespace LumoClient
