// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "Outages.h"
#include "ReplySource.h"
#include "View.h"

namespace Lumod {

/// The reply that tells storage containers: first the table of the arrays that they name, then the containers.
/// @param containers places in View::containers, in the order in which they are told
/// @param outages    their endpoints are told as inaccessible
ReplyPtr storageReply(std::shared_ptr<View const> view, std::vector<uint32_t> containers, Outages::Uids outages);

} // namespace Lumod
