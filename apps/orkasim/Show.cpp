// SPDX-License-Identifier: Apache-2.0
#include <ostream>

#include <fmt/format.h>

#include "Commands.h"
#include "Words.h"
#include "orka/ArrayFile.h"

namespace Orkasim {

void show(Words const &words, Console const &console) {
    SortedWords const sorted(words, {});
    Orka::ArrayFile file(sorted.named({"ARRAYFILE"})[0]);
    auto const counts = file.counts();
    auto const context = file.hostContext();
    console.out << fmt::format("Array file:          {}\n"
                               "Storage arrays:      {}\n"
                               "Protocol endpoints:  {}\n"
                               "Storage containers:  {}\n"
                               "Config volumes:      {}\n"
                               "Data volumes:        {}\n"
                               "Bound volumes:       {}\n"
                               "Metadata pairs:      {}\n"
                               "Host's context:      {}\n",
                               printable(file.path()), counts.arrays, counts.endpoints, counts.containers,
                               counts.configVolumes, counts.dataVolumes, counts.boundVolumes, counts.metadataPairs,
                               context ? printable(*context) : "none");
}

} // namespace Orkasim
