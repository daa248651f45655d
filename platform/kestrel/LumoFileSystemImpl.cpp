// SPDX-License-Identifier: Apache-2.0
#include "Edge.h"
#include "kestrel/Storage.h"
#include "lumolib/Client.h"
#include "store/HostStore.h"

namespace Kestrel::Storage {
namespace {

template <typename Operation>
void onStore(Operation const &operation) {
    atEdge([&] {
        Store::HostStore store(LumoClient::Settings::fromEnvironment().root, Store::HostStore::Mode::ReadWrite);
        operation(store);
    });
}

} // namespace

void LumoFileSystemImpl::UnRegisterVendorProvider(std::string const &name) {
    onStore([&](Store::HostStore &store) {
        if (!store.removeProvider(name)) {
            throw Wire::Failure(Wire::ErrorCode::NoSuchProvider,
                                "no Orka provider named '" + name + "' is registered on this host");
        }
    });
}

void LumoFileSystemImpl::SetOrkaContext(std::string const &uuid) {
    onStore([&](Store::HostStore &store) { store.setOrkaContext(uuid); });
}

void LumoFileSystemImpl::ClearOrkaContext() {
    onStore([](Store::HostStore &store) { store.clearOrkaContext(); });
}

} // namespace Kestrel::Storage
