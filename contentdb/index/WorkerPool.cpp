#include "contentdb/index/WorkerPool.h"

#include "contentdb/index/WorkerMessages.h"
#include "contentdb/index/WorkerSettings.h"
#include "platform/base/Log.h"
#include "platform/processes/ChildProcess.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <map>
#include <utility>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

using Clock = std::chrono::steady_clock;

/// Most items that are queued for one worker; enough that it never waits.
constexpr std::size_t kQueuePerWorker = 128;
/// Longest wait until the time limits are looked at again.
constexpr std::chrono::milliseconds kPatience{100};
/// Longest that a worker may take until it works on an item: it makes its describer first.
constexpr std::chrono::seconds kLongestSilence{30};
constexpr unsigned kMostBarrenWorkers = 5;

std::string howItEnded(const ProcessEnd& end) {
    if (!end.isKnown) return "ended the process (it is not known how)";
    if (!end.signal.empty()) return fmt::format("crashed ({})", end.signal);
    return fmt::format("ended the process (status {})", end.status);
}

}  // namespace

struct WorkerPool::Worker {
    std::unique_ptr<ChildProcess> process;  // none while there is no work for it
    bool isOfOurEdition = false;
    std::string fault;                 // why it has to be ended
    std::uint64_t ticket = 0;          // what it was last seen working on
    std::chrono::nanoseconds time{0};  // how long it has been at that
    std::string output;
    std::string input;
    std::map<std::uint64_t, ItemTask> waiting;  // in the order of tickets, which is that of submission

    std::uint64_t currentTicket() const { return WorkerStatus::in(process->memory()).ticket; }
};

WorkerPool::WorkerPool(Settings settings)
    : settings_(std::move(settings)),
      settingsOfWorkers_(encodedWorkerSettings()),
      workers_(std::max(1U, settings_.workers)) {}

WorkerPool::~WorkerPool() {
    for (Worker& worker : workers_) {
        if (!worker.process) continue;
        // All that have nothing to do end by themselves, at the same time.
        if (worker.waiting.empty()) {
            worker.process->hangUp();
        } else {
            worker.process->kill();
        }
    }
}

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
    const auto begin = Clock::now();
    std::vector<ChildProcess::Awaited> awaited;
    for (Worker& worker : workers_) {
        // A process is made when there is work for it: a run that finds nothing new makes none.
        if (!worker.process && !worker.waiting.empty() && !start(worker)) return false;
        if (!worker.process) continue;
        worker.process->send(worker.output);
        awaited.push_back({worker.process.get(), !worker.output.empty()});
    }
    ChildProcess::await(awaited, kPatience);
    for (Worker& worker : workers_) {
        if (!worker.process) continue;
        const bool isThere = receive(worker, take);
        if (problem_.isSet()) return false;
        if (isThere) judge(worker, Clock::now() - begin);
        if ((!isThere || !worker.fault.empty()) && !replace(worker, take)) return false;
    }
    return true;
}

bool WorkerPool::start(Worker& worker) {
    if (settings_.program.empty()) return fail("the worker program cannot be located");
    worker.process =
        ChildProcess::start(settings_.program, settings_.arguments, sizeof(WorkerStatus), &problem_);
    if (!worker.process) return false;
    worker.isOfOurEdition = false;
    worker.fault.clear();
    worker.ticket = 0;
    worker.time = {};
    worker.input.clear();
    worker.output.clear();
    appendMessage(worker.output, settingsOfWorkers_);
    for (const auto& [ticket, task] : worker.waiting) appendMessage(worker.output, encodedTask(task));
    return true;
}

/// False when nothing more will come, or nothing more is wanted.
bool WorkerPool::receive(Worker& worker, const std::function<void(Described)>& take) {
    const bool isThere = worker.process->receive(worker.input);
    std::size_t at = 0;
    for (std::string_view message; nextMessage(worker.input, at, message);) {
        auto report = decodedReport(message);
        if (!report || !takeReport(worker, *std::move(report), take)) {
            worker.fault = "sent an answer that makes no sense";
            return false;
        }
    }
    worker.input.erase(0, at);
    if (lengthOfMessage(worker.input) > kLongestReport) worker.fault = "sent an answer that is too long";
    return isThere;
}

/// False when the report cannot be true, or the worker is of no use.
bool WorkerPool::takeReport(Worker& worker, WorkerReport report, const std::function<void(Described)>& take) {
    if (report.kind == WorkerReport::Kind::logged) {
        log(report.text);
        return true;
    }
    if (report.kind == WorkerReport::Kind::edition) {
        worker.isOfOurEdition = report.text == workerEdition();
        return worker.isOfOurEdition || fail(fmt::format("is of version \"{}\", and \"{}\" is needed",
                                                         printable(report.text), workerEdition()));
    }
    const auto task = worker.waiting.extract(report.described.ticket);
    if (!worker.isOfOurEdition || task.empty()) return false;
    report.described.setSource(task.mapped());
    worker.time = {};
    barren_ = 0;
    take(std::move(report.described));
    return true;
}

/// Notes how long the worker has been at an item, or without one, and finds fault with it if that is too
/// long. Of the time since the last round only this round's counts, and not more of it than `kPatience`: a
/// worker that waits for this process is not late.
void WorkerPool::judge(Worker& worker, std::chrono::nanoseconds time) const {
    const std::uint64_t ticket = worker.currentTicket();
    const bool isAtTheSame = ticket == worker.ticket && !worker.waiting.empty();
    worker.ticket = ticket;
    worker.time = isAtTheSame ? worker.time + std::min<std::chrono::nanoseconds>(time, kPatience)
                              : std::chrono::nanoseconds(0);
    const bool isIdle = ticket == 0;
    const std::chrono::milliseconds limit = isIdle ? kLongestSilence : settings_.timeLimit;
    if (!isAtTheSame || worker.time < limit) return;
    worker.fault = fmt::format("{} {} s", isIdle ? "did nothing for" : "took longer than",
                               static_cast<double>(limit.count()) / 1000);
}

/// Starts another process in place of one that has ended or is at fault, if there is work for it; the item
/// that it was working on has failed.
bool WorkerPool::replace(Worker& worker, const std::function<void(Described)>& take) {
    const std::uint64_t culprit = worker.currentTicket();
    if (!worker.fault.empty()) worker.process->kill();
    const ProcessEnd end = worker.process->end();
    worker.process.reset();
    const std::string reason = worker.fault.empty() ? howItEnded(end) : worker.fault;
    const auto hit = worker.waiting.find(culprit);
    if (hit != worker.waiting.end()) {
        Described failed;
        failed.ticket = culprit;
        failed.setSource(hit->second);
        failed.item.failure = "reading it " + reason;
        worker.waiting.erase(hit);
        take(std::move(failed));
    } else if (++barren_ > kMostBarrenWorkers) {
        return fail(fmt::format("{} before it described anything, {} times in a row", reason, barren_));
    }
    return worker.waiting.empty() || start(worker);
}

bool WorkerPool::fail(std::string reason) {
    return qvct::fail(&problem_, kErrorUnreadable, std::move(reason), {settings_.program});
}

}  // namespace qvct::contentdb
