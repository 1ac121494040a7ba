#pragma once

#include "contentdb/index/DescriberPool.h"

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace qvct::contentdb {

/// What a worker shows to the process that started it, in memory that both see and that begins as zeros.
struct WorkerStatus {
    std::atomic<bool> hasDescriber;
    std::atomic<std::uint64_t> ticket;  ///< The item that it is working on; 0 for none.
    std::atomic<std::int64_t> since;    ///< When it began, as `now` tells.

    static WorkerStatus& in(void* memory) { return *static_cast<WorkerStatus*>(memory); }
    /// Nanoseconds of the clock that all processes have in common.
    static std::int64_t now();
};

/// A message is its length (4 bytes, little endian) and its bytes.
void appendMessage(std::string& stream, std::string_view message);
/// Takes the first whole message off the stream, from `at` on; false when there is none yet.
bool nextMessage(std::string_view stream, std::size_t& at, std::string_view& message);

/// A worker is sent its settings (`WorkerSettings`), and then tasks.
std::string encodedTask(const ItemTask& task);
ItemTask decodedTask(std::string_view message);

/// What a worker says: first its version, then what it has described and logged.
struct WorkerReport {
    enum class Kind : unsigned char { version, described, logged };

    Kind kind = Kind::version;
    std::string text;  ///< The version, or the line of the log.
    Described described;
};

std::string encodedReport(WorkerReport::Kind kind, std::string_view text);
std::string encodedReport(const Described& described);
/// Nothing when the bytes are no report.
std::optional<WorkerReport> decodedReport(std::string_view message);

}  // namespace qvct::contentdb
