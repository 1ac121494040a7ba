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
    std::atomic<std::uint64_t> ticket;  ///< The item that it is working on; 0 for none.

    static WorkerStatus& in(void* memory) { return *static_cast<WorkerStatus*>(memory); }
};

/// A message is its length (4 bytes, little endian) and its bytes.
void appendMessage(std::string& stream, std::string_view message);
/// Takes the first whole message off the stream, from `at` on; false when there is none yet.
bool nextMessage(std::string_view stream, std::size_t& at, std::string_view& message);
/// How long the first message is, though it may not be there as a whole; 0 when not even its length is.
std::size_t lengthOfMessage(std::string_view stream);

/// A worker is sent its settings (`WorkerSettings`), and then tasks.
std::string encodedTask(const ItemTask& task);
ItemTask decodedTask(std::string_view message);

/// Longest report that a worker may make.
constexpr std::size_t kLongestReport = 16U << 20U;

/// What a worker says: first its edition, then what it has described and logged.
struct WorkerReport {
    enum class Kind : unsigned char { edition, described, logged };

    Kind kind = Kind::edition;
    std::string text;     ///< The edition, or the line of the log.
    Described described;  ///< Without a path: the task has it.
};

/// What a worker has to have in common with the process that started it: version and form of messages.
std::string workerEdition();

std::string encodedReport(WorkerReport::Kind kind, std::string_view text);
std::string encodedReport(const Described& described);
/// Nothing when the bytes are no report.
std::optional<WorkerReport> decodedReport(std::string_view message);

}  // namespace qvct::contentdb
