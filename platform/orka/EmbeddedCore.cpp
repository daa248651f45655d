// SPDX-License-Identifier: Apache-2.0
#include "EmbeddedCore.h"

namespace Orka {

EmbeddedProvider::Core::Core(std::string path, ProviderSurroundings const &surroundings)
    : path_(std::move(path))
    , timer_(surroundings.timer)
    , newUuid_(surroundings.newUuid) {}

ArrayFile &EmbeddedProvider::Core::openFile() {
    if (file_ && file_->hasMoved()) {
        file_.reset();
    }
    if (!file_) {
        // Another file may have the data version that the last one had.
        inventoryDataVersion_.reset();
        file_ = std::make_unique<ArrayFile>(path_, std::chrono::milliseconds(0), newUuid_);
    }
    return *file_;
}

bool EmbeddedProvider::Core::mustReopenAfter(Wire::ErrorCode code) {
    switch (code) {
    case Wire::ErrorCode::FileMissing:
    case Wire::ErrorCode::FileMalformed:
    case Wire::ErrorCode::FileForeign:
    case Wire::ErrorCode::FileNewer:
    case Wire::ErrorCode::FileReadOnly:
    case Wire::ErrorCode::IoError:
    case Wire::ErrorCode::InternalError: {
        bool const replaced = file_ && file_->hasMoved();
        file_.reset();
        return replaced;
    }
    default:
        return false;
    }
}

EmbeddedProvider::Core::VersionedInventory EmbeddedProvider::Core::inventory(ArrayFile &file) {
    if (!inventoryDataVersion_ || *inventoryDataVersion_ != file.dataVersion()) {
        auto read = file.inventory();
        inventory_.arrays = std::make_shared<std::vector<StorageArray> const>(std::move(read.arrays));
        inventory_.containers = std::make_shared<std::vector<StorageContainer> const>(std::move(read.containers));
        ++inventory_.version;
        inventoryDataVersion_ = read.dataVersion;
    }
    return inventory_;
}

Wire::Failure EmbeddedProvider::Core::tooLate() const {
    return {Wire::ErrorCode::DeadlineExceeded,
            "the deadline had passed before the array file '" + path_ + "' could be asked"};
}

Wire::Failure EmbeddedProvider::Core::stillLocked() const {
    return {Wire::ErrorCode::ProviderBusy,
            "the array file '" + path_ + "' is busy: another process held its lock until the deadline"};
}

} // namespace Orka
