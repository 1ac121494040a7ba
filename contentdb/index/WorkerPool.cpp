#include "contentdb/index/WorkerPool.h"

#include "contentdb/index/WorkerMessages.h"
#include "contentdb/index/WorkerSettings.h"
#include "platform/base/Log.h"
#include "platform/base/Version.h"
#include "platform/processes/ChildProcess.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <map>
#include <utility>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

/// Most items that are queued for one worker; enough that it never waits.
constexpr std::size_t kQueuePerWorker = 128;
/// Longest that a worker may take to make its describer.
constexpr std::chrono::milliseconds kLongestStart{30000};
constexpr unsigned kMostBarrenWorkers = 5;

}  // namespace

struct WorkerPool::Worker {
    std::unique_ptr<ChildProcess> process;  // none while there is no work for it
    std::int64_t started = 0;
    bool isOfOurVersion = false;
    bool wasLate = false;
    std::string output;
    std::string input;
    std::map<std::uint64_t, ItemTask> waiting;  // in the order of tickets, which is that of submission

    const WorkerStatus& status() const { return WorkerStatus::in(process->memory()); }
};

WorkerPool::WorkerPool(Settings settings)
    : settings_(std::move(settings)), workers_(std::max(1U, settings_.workers)) {}

WorkerPool::~WorkerPool() = default;

bool WorkerPool::hasRoom() const {
    return std::any_of(workers_.begin(), workers_.end(),
                       [](const Worker& worker) { return worker.waiting.size() < kQueuePerWorker; });
}

void WorkerPool::submit(ItemTask task) {
    Worker& worker = *std::min_element(
        workers_.begin(), workers_.end(),
        [](const Worker& a, const Worker& b) { return a.waiting.size() < b.waiting.size(); });
    if (worker.process) appendMessage(worker.output, encodedTask(task));
    worker.waiting.emplace(task.ticket, std::move(task));
}

bool WorkerPool::isBusy() const {
    return std::any_of(workers_.begin(), workers_.end(),
                       [](const Worker& worker) { return !worker.waiting.empty(); });
}

bool WorkerPool::collect(const std::function<void(Described)>& take) {
    constexpr std::chrono::milliseconds patience(100);  // until the time limits are looked at again
    std::vector<ChildProcess::Awaited> awaited;
    for (Worker& worker : workers_) {
        // A process is made when there is work for it: a run that finds nothing new makes none.
        if (!worker.process && !worker.waiting.empty() && !start(worker)) return false;
        if (!worker.process) continue;
        worker.process->send(worker.output);
        awaited.push_back({worker.process.get(), !worker.output.empty()});
    }
    ChildProcess::await(awaited, patience);
    for (Worker& worker : workers_) {
        if (!worker.process) continue;
        endIfLate(worker);
        const Receipt receipt = receive(worker, take);
        if (receipt == Receipt::refused || (receipt == Receipt::ended && !replace(worker, take)))
            return false;
    }
    return true;
}

bool WorkerPool::start(Worker& worker) {
    worker.process =
        ChildProcess::start(settings_.program, settings_.arguments, sizeof(WorkerStatus), &problem_);
    if (!worker.process) return false;
    worker.started = WorkerStatus::now();
    worker.isOfOurVersion = false;
    worker.wasLate = false;
    worker.input.clear();
    worker.output.clear();
    appendMessage(worker.output, encodedWorkerSettings());
    for (const auto& [ticket, task] : worker.waiting) appendMessage(worker.output, encodedTask(task));
    return true;
}

WorkerPool::Receipt WorkerPool::receive(Worker& worker, const std::function<void(Described)>& take) {
    const bool isThere = worker.process->receive(worker.input);
    std::size_t at = 0;
    for (std::string_view message; nextMessage(worker.input, at, message);) {
        const Receipt receipt = takeReport(worker, message, take);
        if (receipt != Receipt::intact) return receipt;
    }
    worker.input.erase(0, at);
    return isThere ? Receipt::intact : Receipt::ended;
}

WorkerPool::Receipt WorkerPool::takeReport(Worker& worker, std::string_view message,
                                           const std::function<void(Described)>& take) {
    auto report = decodedReport(message);
    if (!report) return Receipt::ended;
    if (report->kind == WorkerReport::Kind::version) worker.isOfOurVersion = report->text == version();
    if (!worker.isOfOurVersion) {
        fail(fmt::format("is of version \"{}\", and \"{}\" is needed", printable(report->text), version()));
        return Receipt::refused;
    }
    if (report->kind == WorkerReport::Kind::logged) log(report->text);
    if (report->kind == WorkerReport::Kind::described) {
        if (worker.waiting.erase(report->described.ticket) == 0) return Receipt::ended;
        barren_ = 0;
        take(std::move(report->described));
    }
    return Receipt::intact;
}

/// Starts another process in place of one that has ended; the item that it was working on has failed.
bool WorkerPool::replace(Worker& worker, const std::function<void(Described)>& take) {
    const std::uint64_t culprit = worker.status().ticket;
    const std::string reason = end(worker);
    const auto hit = worker.waiting.find(culprit);
    if (hit != worker.waiting.end()) {
        Described failed;
        failed.ticket = culprit;
        failed.item.path = std::move(hit->second.path);
        failed.item.stamp = hit->second.stamp;
        failed.item.failure = "reading it " + reason;
        worker.waiting.erase(hit);
        take(std::move(failed));
    } else if (++barren_ > kMostBarrenWorkers) {
        return fail(fmt::format("{} before it described anything, {} times in a row", reason, barren_));
    }
    return start(worker);
}

/// Ends the process and answers how it came to its end.
std::string WorkerPool::end(Worker& worker) const {
    const ProcessEnd end = worker.process->end();
    worker.process.reset();
    if (worker.wasLate)
        return fmt::format("took longer than {} s", static_cast<double>(settings_.timeLimit.count()) / 1000);
    if (!end.signal.empty()) return fmt::format("crashed ({})", end.signal);
    return fmt::format("ended the process (status {})", end.status);
}

void WorkerPool::endIfLate(Worker& worker) const {
    const WorkerStatus& status = worker.status();
    const std::uint64_t ticket = status.ticket;
    const bool isStarting = ticket == 0 && !status.hasDescriber;
    if (ticket == 0 && !isStarting) return;
    const std::chrono::nanoseconds limit = isStarting ? kLongestStart : settings_.timeLimit;
    const std::int64_t since = isStarting ? worker.started : status.since.load();
    if (WorkerStatus::now() - since < limit.count()) return;
    if (status.ticket != ticket) return;  // it has gone on meanwhile
    worker.wasLate = true;
    worker.process->kill();
}

bool WorkerPool::fail(std::string reason) {
    return qvct::fail(&problem_, kErrorUnreadable, std::move(reason), {settings_.program});
}

}  // namespace qvct::contentdb
