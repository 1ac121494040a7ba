#include "contentdb/index/WorkerMessages.h"

#include "contentdb/store/codec/ItemCodec.h"
#include "platform/base/Version.h"
#include "platform/base/bytes/ByteOrder.h"

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

constexpr std::size_t kLengthBytes = 4;
/// Raised when a change makes workers and those who start them misunderstand each other.
constexpr unsigned kProtocol = 2;

}  // namespace

static_assert(std::atomic<std::uint64_t>::is_always_lock_free, "other processes see no lock of ours");

void appendMessage(std::string& stream, std::string_view message) {
    stream += bytesOf(message.size(), kLengthBytes, ByteOrder::little);
    stream += message;
}

std::size_t lengthOfMessage(std::string_view stream) {
    if (stream.size() < kLengthBytes) return 0;
    return numberOf(stream.substr(0, kLengthBytes), ByteOrder::little);
}

bool nextMessage(std::string_view stream, std::size_t& at, std::string_view& message) {
    const std::string_view rest = stream.substr(at);
    const std::size_t length = lengthOfMessage(rest);
    if (rest.size() < kLengthBytes + length) return false;
    message = rest.substr(kLengthBytes, length);
    at += kLengthBytes + length;
    return true;
}

std::string encodedTask(const ItemTask& task) {
    ByteWriter out;
    out.number(task.ticket);
    out.text(task.path);
    out.stamp(task.stamp);  // an item is found by its size, too
    return out.take();
}

ItemTask decodedTask(std::string_view message) {
    ByteReader in(message);
    ItemTask task;
    task.ticket = in.number();
    task.path = in.text();
    task.stamp = in.stamp();
    return task;
}

std::string workerEdition() {
    return fmt::format("{}, protocol {}", version(), kProtocol);
}

std::string encodedReport(WorkerReport::Kind kind, std::string_view text) {
    ByteWriter out;
    out.number(static_cast<std::uint64_t>(kind));
    out.text(text);
    return out.take();
}

std::string encodedReport(const Described& described) {
    const IndexedItem& item = described.item;
    ByteWriter out;
    out.number(static_cast<std::uint64_t>(WorkerReport::Kind::described));
    out.number(described.ticket);
    out.number(described.wasAway ? 1 : 0);
    out.text(item.payloadHash);
    out.text(encodedDescription(item));
    out.number(described.terms.size());
    for (const std::string& term : described.terms) out.text(term);
    return out.take();
}

std::optional<WorkerReport> decodedReport(std::string_view message) {
    ByteReader in(message);
    WorkerReport report;
    const std::uint64_t kind = in.number();
    if (kind > static_cast<std::uint64_t>(WorkerReport::Kind::logged)) return std::nullopt;
    report.kind = static_cast<WorkerReport::Kind>(kind);
    bool isWhole = true;
    if (report.kind == WorkerReport::Kind::described) {
        Described& described = report.described;
        described.ticket = in.number();
        described.wasAway = in.number() != 0;
        described.item.payloadHash = in.text();
        isWhole = decodeDescription(in.text(), described.item);
        for (std::size_t left = in.count(); left > 0; --left) described.terms.emplace_back(in.text());
    } else {
        report.text = in.text();
    }
    return isWhole && in.isIntact() && in.isAtEnd() ? std::optional(std::move(report)) : std::nullopt;
}

}  // namespace qvct::contentdb
