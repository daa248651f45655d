// SPDX-License-Identifier: Apache-2.0
//
// What the client library adds to the daemon's answer about all storage containers.
//
//   bench_query time ROUNDS   one line a round: nanoseconds through the library, nanoseconds for the raw bytes
//   bench_query first         one line: nanoseconds of the first answer, through the library
//   bench_query memory        one line: bytes of the records, bytes of memory they take, bytes the process grew at its
//                             peak
//
// Both on the daemon of TOVI_ROOT. The raw side asks the same daemon the same question and reads the same replies.
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <fstream>
#include <malloc.h>
#include <set>
#include <stdexcept>
#include <string>

#include "PreparedSession.h"
#include "lumolib/LumoLib.h"

namespace {

StorageContainerResult *query() {
    StorageContainerResult *result = nullptr;
    LumoErrorEx const error = LumoLib_GetStorageContainer(1, nullptr, &result);
    if (!LumoLib_ErrorExIsSuccess(&error)) {
        throw std::runtime_error(LumoLib_ErrorExStr(&error));
    }
    return result;
}

template <typename Work>
long long nanosecondsOf(Work const &work) {
    auto const start = std::chrono::steady_clock::now();
    work();
    return std::chrono::duration_cast<std::chrono::nanoseconds>(std::chrono::steady_clock::now() - start).count();
}

void printTimes(std::string const &root, int rounds) {
    Bench::PreparedSession raw(root + "/run/lumod.sock");
    raw.prepare([](Wire::Request::Builder request) { request.setGetStorageContainer(); });
    LumoLib_FreeStorageContainerResult(query()); // a warm-up, like the raw side's first round
    for (int round = 0; round < rounds; ++round) {
        long long const library = nanosecondsOf([] { LumoLib_FreeStorageContainerResult(query()); });
        long long const floor = nanosecondsOf([&raw] { raw.ask(); });
        std::printf("%lld %lld\n", library, floor);
    }
}

size_t sizeOf(char const *text) {
    return text == nullptr ? 0 : std::strlen(text) + 1;
}

size_t sizeOf(StorageArrayInfo const &array) {
    size_t size = sizeof(array) + sizeOf(array.arrayId) + sizeOf(array.name) + sizeOf(array.vendorId) +
                  sizeOf(array.modelId) + static_cast<size_t>(array.endpointCount) * sizeof(ProtocolEndpointInfo *);
    for (int32_t i = 0; i < array.endpointCount; ++i) {
        ProtocolEndpointInfo const &endpoint = *array.endpoints[i];
        size += sizeof(endpoint) + sizeof(EndpointTransportInfo) + sizeOf(endpoint.localUID) +
                sizeOf(endpoint.transport->text1) + sizeOf(endpoint.transport->text2);
        for (int32_t address = 0; address < endpoint.nfs4xAddressCount; ++address) {
            size += sizeof(char const *) + sizeOf(endpoint.nfs4xAddresses[address]);
        }
    }
    return size;
}

/// The bytes that a caller reads: structures, tables of pointers, texts; records that containers share count once.
size_t sizeOf(StorageContainerResult const &result) {
    size_t size = sizeof(result) + result.containerCount * sizeof(StorageContainerInfo *);
    std::set<void const *> seen;
    for (uint32_t i = 0; i < result.containerCount; ++i) {
        StorageContainerInfo const &container = *result.containers[i];
        size += sizeof(container) + sizeOf(container.name) + sizeOf(container.id);
        // Containers on the same arrays may have one table of pointers.
        size += seen.insert(container.arrays).second
                    ? static_cast<size_t>(container.arrayCount) * sizeof(StorageArrayInfo *)
                    : 0;
        size += seen.insert(container.providerUrl).second ? sizeOf(container.providerUrl) : 0;
        for (int32_t array = 0; array < container.arrayCount; ++array) {
            size += seen.insert(container.arrays[array]).second ? sizeOf(*container.arrays[array]) : 0;
        }
    }
    return size;
}

/// A figure of /proc/self/FILE in bytes.
size_t memoryFigure(std::string const &file, std::string const &name) {
    std::ifstream figures("/proc/self/" + file);
    for (std::string line; std::getline(figures, line);) {
        if (line.compare(0, name.size() + 1, name + ":") == 0) {
            return std::strtoull(line.c_str() + name.size() + 1, nullptr, 10) * 1024;
        }
    }
    throw std::runtime_error("/proc/self/" + file + " does not tell " + name);
}

/// Resident memory, so that it does not matter where a library gets its own from. The first answer brings in code and
/// whatever else is kept, and is given back. What a result takes is read from the page tables: the counters behind
/// `status` may be a hundred pages late, which is more than a thousand containers need.
void printMemory() {
    LumoLib_FreeStorageContainerResult(query());
    malloc_trim(0);
    std::ofstream("/proc/self/clear_refs") << 5; // the peak begins anew
    size_t const before = memoryFigure("smaps_rollup", "Anonymous");
    size_t const residentBefore = memoryFigure("status", "VmRSS");
    StorageContainerResult *const result = query();
    malloc_trim(0); // what the answer came through is not of the records
    size_t const taken = memoryFigure("smaps_rollup", "Anonymous") - before;
    size_t const peak = memoryFigure("status", "VmHWM") - residentBefore;
    std::printf("%zu %zu %zu\n", sizeOf(*result), taken, peak);
    LumoLib_FreeStorageContainerResult(result);
}

} // namespace

int main(int argc, char **argv) {
    char const *const root = std::getenv("TOVI_ROOT");
    std::string const mode = argc > 1 ? argv[1] : "";
    int const rounds = argc > 2 ? std::atoi(argv[2]) : 0;
    if (root == nullptr || !((mode == "time" && rounds > 0) || mode == "first" || mode == "memory")) {
        std::fputs("usage: TOVI_ROOT=DIR bench_query time ROUNDS | first | memory\n", stderr);
        return 2;
    }
    try {
        if (!LumoLib_Init(0, 0)) {
            throw std::runtime_error("no daemon answers");
        }
        if (mode == "time") {
            printTimes(root, rounds);
        } else if (mode == "first") {
            std::printf("%lld\n", nanosecondsOf([] { LumoLib_FreeStorageContainerResult(query()); }));
        } else {
            printMemory();
        }
        LumoLib_Exit();
    } catch (std::exception const &error) {
        std::fprintf(stderr, "bench_query: %s\n", error.what());
        return 1;
    }
    return std::fflush(stdout) == 0 ? 0 : 1;
}
