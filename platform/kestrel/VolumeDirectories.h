// SPDX-License-Identifier: Apache-2.0
//
// Where the directory of a config volume is: mounted (volumes/<container>/<directory name>) or put away (lumos/<uuid>).
//
// A change is a record in the store and then a rename; the record counts. Whoever changes anything holds the lock of
// lumos/, so that no two processes are between record and rename at once. A record that a killed process left unsettled
// is found by the next operation, which finishes the rename and, in the transaction that it writes anyway, settles the
// record: no change costs a second transaction.
#pragma once

#include <string>
#include <vector>

#include "DirectoryLock.h"
#include "Host.h"

namespace Kestrel {

class VolumeDirectories {
public:
    /// Takes the lock for the object's life. Throws Wire::Failure, like everything here.
    explicit VolumeDirectories(Host &host);

    /// Finishes what others left unfinished.
    /// @return the records that are now known to be done, for Store::HostStore::putVolumes
    std::vector<Store::Volume> const &finishUnsettled();
    /// Of those, the removals that had really been cut off: their content is gone only now.
    std::vector<Store::Volume> const &removedNow() const {
        return removedNow_;
    }

    /// Makes sure that mounting can succeed: the content's directory exists, and nothing stands where it is to appear.
    void prepareMount(Store::Volume const &volume, std::string const &containerName);
    void bringOut(Store::Volume const &volume, std::string const &containerName);
    /// A directory that is not there needs no putting away.
    void putAway(Store::Volume const &volume, std::string const &containerName);
    /// Deletes what a volume that is put away holds.
    void discard(std::string const &uuid);

private:
    void finish(Store::Volume const &volume, std::string const &containerName);
    /// volumes/<container>, made when it is missing, and kept open for the next step.
    Directory const &container(std::string const &name);

    Host &host_;
    DirectoryLock lock_;
    std::vector<Store::Volume> settled_;
    std::vector<Store::Volume> removedNow_;
    Directory container_;
    std::string containerName_;
};

} // namespace Kestrel
