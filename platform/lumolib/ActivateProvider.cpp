// SPDX-License-Identifier: Apache-2.0
//
// Which provider serves an array, and pretending that a provider's state changed.
#include "Session.h"

#include "wire/Limits.h"

using namespace LumoClient;

namespace {

/// No array entry takes fewer bytes on the wire; what cannot fit is refused before room is made for it.
constexpr std::size_t leastEntryBytes = 16;

} // namespace

int32_t LumoLib_ActivateProvider(char const *arrayId, char const *vpName, char const *activeVpUrl, void *) {
    return answer([=](Connection &connection) {
        connection.change([=](Compact::Request::Builder request) {
            Compact::ActivateProvider::Builder activation = request.initActivateProvider();
            activation.setArrayId(argument(arrayId));
            activation.setProviderName(argument(vpName));
            activation.setActiveProviderUrl(argument(activeVpUrl));
        });
    });
}

int32_t LumoLib_DeactivateProvider(char const *arrayId, char const *vpName) {
    return answer([=](Connection &connection) {
        connection.change([=](Compact::Request::Builder request) {
            Compact::DeactivateProvider::Builder deactivation = request.initDeactivateProvider();
            deactivation.setArrayId(argument(arrayId));
            deactivation.setProviderName(argument(vpName));
        });
    });
}

int32_t LumoLib_VendorProviderInjectFault(char const *vpName, char const *vpUrl, char const *status, int32_t count,
                                          LumoArrayFault *entries) {
    return answer([=](Connection &connection) {
        if (count < 0 || (count > 0 && entries == nullptr)) {
            throw Wire::Failure(Wire::ErrorCode::InvalidArgument,
                                "a fault of " + std::to_string(count) + " array entries was to be injected");
        }
        auto const size = static_cast<unsigned>(count);
        if (size > Wire::requestBytesMax / leastEntryBytes) {
            throw Wire::Failure(Wire::ErrorCode::MessageTooLarge,
                                std::to_string(count) + " array entries do not fit into one request");
        }
        connection.change([=](Compact::Request::Builder request) {
            Compact::VendorProviderInjectFault::Builder injection = request.initVendorProviderInjectFault();
            injection.setProviderName(argument(vpName));
            injection.setProviderUrl(argument(vpUrl));
            injection.setStatus(argument(status));
            Compact::List<Compact::VendorProviderInjectFault::ArrayFault>::Builder arrays = injection.initArrays(size);
            for (unsigned place = 0; place < size; ++place) {
                arrays[place].setArrayId(argument(entries[place].arrayId));
                arrays[place].setIsActive(entries[place].isActive != 0);
            }
        });
    });
}
