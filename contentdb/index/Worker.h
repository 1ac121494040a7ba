#pragma once

#include "contentdb/IndexedItem.h"
#include "contentdb/index/WorkerPool.h"

#include <atomic>
#include <cstdint>
#include <string>
#include <string_view>

namespace qvct::contentdb {

/// What a worker shows to its supervisor in memory that both see.
struct WorkerStatus {
    std::atomic<bool> isStarting;       ///< it has no describer yet
    std::atomic<std::uint64_t> ticket;  ///< the item that it is at; 0 for none
    std::atomic<std::int64_t> since;    ///< when it began, on the monotonic clock, in nanoseconds
};

std::int64_t monotonicNanoseconds();

/// A message is its length (4 bytes, little endian) and its bytes.
void appendMessage(std::string& stream, std::string_view message);
/// Takes the first whole message off the stream, from `at` on; false when there is none yet.
bool nextMessage(std::string_view stream, std::size_t& at, std::string_view& message);

std::string encodedTask(std::uint64_t ticket, std::string_view path, const ItemStamp& stamp);
/// Whether the bytes are an answer of a worker.
bool decodeAnswer(std::string_view message, Described& described);

/// Describes what comes in on `socket` until it is closed. Never returns.
[[noreturn]] void runWorker(int socket, WorkerStatus& status, const DescriberFactory& factory);

}  // namespace qvct::contentdb
