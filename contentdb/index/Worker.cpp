#include "contentdb/index/Worker.h"

#include "contentdb/store/ItemCodec.h"
#include "contentdb/terms/Terms.h"
#include "platform/base/HardLimit.h"
#include "platform/files/FileAccess.h"

#include <csignal>
#include <ctime>
#include <exception>

#include <poll.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <unistd.h>

namespace qvct::contentdb {
namespace {

constexpr std::size_t kLengthBytes = 4;
/// Answers are sent together up to this size, or as soon as there is nothing else to do.
constexpr std::size_t kAnswersAtOnce = 1U << 16U;

struct Task {
    std::uint64_t ticket = 0;
    std::string path;
    ItemStamp stamp;
};

Task decodedTask(std::string_view message) {
    ByteReader in(message);
    Task task;
    task.ticket = in.number();
    task.path = in.text();
    task.stamp = in.stamp();
    return task;
}

std::string encodedAnswer(std::uint64_t ticket, const IndexedItem& item) {
    ByteWriter out;
    out.number(ticket);
    out.text(item.path);
    out.stamp(item.stamp);
    out.text(item.payloadHash);
    out.text(encodedDescription(item));
    const std::vector<std::string> terms = termsOf(item);
    out.number(terms.size());
    for (const std::string& term : terms) out.text(term);
    return out.take();
}

IndexedItem described(ItemDescriber& describer, const Task& task) {
    IndexedItem item;
    try {
        Error error;
        if (auto found = describer.describe(task.path, &error)) {
            item = std::move(*found);
        } else {
            item.failure = error.message.empty() ? "no description" : error.message;
        }
    } catch (const std::exception& fault) {
        item = {};
        item.failure = fault.what();
    }
    item.path = task.path;
    item.stamp = task.stamp;
    // Away, perhaps for a moment: what was read may not be all, and a failure not the item's own.
    if (!fileExists(task.path)) item.stamp = {};
    return item;
}

bool sendAll(int socket, std::string& bytes) {
    for (std::size_t at = 0; at < bytes.size();) {
        const ssize_t sent = ::send(socket, bytes.data() + at, bytes.size() - at, MSG_NOSIGNAL);
        if (sent <= 0) return false;
        at += static_cast<std::size_t>(sent);
    }
    bytes.clear();
    return true;
}

bool hasInput(int socket) {
    pollfd waiting{socket, POLLIN, 0};
    return ::poll(&waiting, 1, 0) > 0;
}

void work(int socket, WorkerStatus& status, ItemDescriber& describer) {
    std::string input;
    std::string output;
    std::string chunk(kAnswersAtOnce, '\0');
    while (true) {
        if (!output.empty() && !hasInput(socket) && !sendAll(socket, output)) return;
        const ssize_t count = ::recv(socket, chunk.data(), chunk.size(), 0);
        if (count <= 0) return;
        input.append(chunk, 0, static_cast<std::size_t>(count));
        std::size_t at = 0;
        for (std::string_view message; nextMessage(input, at, message);) {
            const Task task = decodedTask(message);
            status.since = monotonicNanoseconds();
            status.ticket = task.ticket;
            appendMessage(output, encodedAnswer(task.ticket, described(describer, task)));
            status.ticket = 0;
            if (output.size() >= kAnswersAtOnce && !sendAll(socket, output)) return;
        }
        input.erase(0, at);
    }
}

}  // namespace

std::int64_t monotonicNanoseconds() {
    timespec now{};
    ::clock_gettime(CLOCK_MONOTONIC, &now);
    constexpr std::int64_t second = 1'000'000'000;
    return now.tv_sec * second + now.tv_nsec;
}

void appendMessage(std::string& stream, std::string_view message) {
    for (std::size_t i = 0; i < kLengthBytes; ++i)
        stream += static_cast<char>(message.size() >> (8 * i) & 0xFFU);
    stream += message;
}

bool nextMessage(std::string_view stream, std::size_t& at, std::string_view& message) {
    if (stream.size() - at < kLengthBytes) return false;
    std::size_t size = 0;
    for (std::size_t i = kLengthBytes; i > 0; --i)
        size = size << 8U | static_cast<unsigned char>(stream[at + i - 1]);
    if (stream.size() - at - kLengthBytes < size) return false;
    message = stream.substr(at + kLengthBytes, size);
    at += kLengthBytes + size;
    return true;
}

std::string encodedTask(std::uint64_t ticket, std::string_view path, const ItemStamp& stamp) {
    ByteWriter out;
    out.number(ticket);
    out.text(path);
    out.stamp(stamp);
    return out.take();
}

bool decodeAnswer(std::string_view message, Described& described) {
    ByteReader in(message);
    described.ticket = in.number();
    described.item.path = in.text();
    described.item.stamp = in.stamp();
    described.item.payloadHash = in.text();
    const bool isItem = decodeDescription(in.text(), described.item);
    for (std::size_t left = in.count(); left > 0; --left) described.terms.emplace_back(in.text());
    return isItem && in.isIntact() && in.isAtEnd();
}

void runWorker(int socket, WorkerStatus& status, const DescriberFactory& factory) {
    // Interrupting the run is the supervisor's business; the worker ends when its supervisor does.
    ::signal(SIGINT, SIG_IGN);
    ::signal(SIGTERM, SIG_DFL);
    ::prctl(PR_SET_PDEATHSIG, SIGKILL);
    HardLimit::enable();
    try {
        const auto describer = factory();
        status.isStarting = false;
        if (describer) work(socket, status, *describer);
    } catch (const std::exception&) {
        ::_exit(1);
    }
    ::_exit(0);
}

}  // namespace qvct::contentdb
