#include "contentdb/IndexWorker.h"

#include "contentdb/index/WorkerMessages.h"
#include "contentdb/index/WorkerSettings.h"
#include "platform/base/Log.h"
#include "platform/processes/HardLimit.h"
#include "platform/processes/ParentProcess.h"

#include <chrono>
#include <cstdlib>
#include <mutex>
#include <utility>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

using Clock = std::chrono::steady_clock;

/// Answers are gathered up to this size or this time, and sent earlier when there is nothing else to do.
constexpr std::size_t kAnswersAtOnce = 1U << 16U;
constexpr std::chrono::milliseconds kLongestWait{100};

std::string answerTo(const ItemTask& task, ItemDescriber& describer) {
    Described described = describedBy(describer, task);
    std::string report = encodedReport(described);
    if (report.size() <= kLongestReport) return report;
    described.item = {};
    described.item.failure = fmt::format("its description takes {} bytes, which is too long", report.size());
    described.terms.clear();
    return encodedReport(described);
}

/// Sends reports to the parent; from any thread.
class Reports {
  public:
    explicit Reports(ParentProcess& parent) : parent_(parent) {}

    /// False when nobody takes them, as of `send`.
    bool add(std::string_view report) {
        const std::lock_guard lock(mutex_);
        appendMessage(bytes_, report);
        const bool isDue = bytes_.size() >= kAnswersAtOnce || Clock::now() - sent_ >= kLongestWait;
        return !isDue || sendAll();
    }
    bool send() {
        const std::lock_guard lock(mutex_);
        return sendAll();
    }

  private:
    bool sendAll() {
        sent_ = Clock::now();
        return bytes_.empty() || parent_.send(bytes_);
    }

    ParentProcess& parent_;
    std::mutex mutex_;
    std::string bytes_;
    Clock::time_point sent_ = Clock::now();
};

class Worker {
  public:
    explicit Worker(ParentProcess parent)
        : parent_(std::move(parent)),
          status_(WorkerStatus::in(parent_.memory())),
          handlerBefore_(setLogHandler([this](std::string_view line) { logToParent(line); })) {}
    Worker(const Worker&) = delete;
    Worker& operator=(const Worker&) = delete;
    ~Worker() { setLogHandler(std::move(handlerBefore_)); }

    void run(const DescriberFactory& factory) {
        reports_.add(encodedReport(WorkerReport::Kind::edition, workerEdition()));
        if (!receiveSettings()) return;
        const auto describer = factory();
        if (!describer) return;
        while (describeAll(*describer) && receive()) {
        }
    }

  private:
    /// Sends what there is to be sent before it waits for more.
    bool receive() { return (parent_.hasInput() || reports_.send()) && parent_.receive(input_); }

    bool receiveSettings() {
        std::size_t at = 0;
        for (std::string_view message; receive();) {
            if (!nextMessage(input_, at, message)) continue;
            applyWorkerSettings(message);
            input_.erase(0, at);
            return true;
        }
        return false;
    }

    /// Of the tasks that have arrived. False when nobody takes the answers.
    bool describeAll(ItemDescriber& describer) {
        std::size_t at = 0;
        for (std::string_view message; nextMessage(input_, at, message);) {
            const ItemTask task = decodedTask(message);
            status_.ticket = task.ticket;
            const std::string answer = answerTo(task, describer);
            status_.ticket = 0;
            if (!reports_.add(answer)) return false;
        }
        input_.erase(0, at);
        return true;
    }

    /// Sent at once, since this process may end at any moment.
    void logToParent(std::string_view line) {
        reports_.add(encodedReport(WorkerReport::Kind::logged, line.substr(0, kLongestReport / 2)));
        reports_.send();
    }

    ParentProcess parent_;
    WorkerStatus& status_;
    Reports reports_{parent_};
    std::string input_;
    LogHandler handlerBefore_;
};

}  // namespace

int runIndexWorker(const DescriberFactory& factory) {
    auto parent = ParentProcess::connect(sizeof(WorkerStatus));
    if (!parent) {
        log("this program is started by one that indexes a library, and does nothing by itself");
        return EXIT_FAILURE;
    }
    HardLimit::enable();
    Worker worker(*std::move(parent));
    try {
        worker.run(factory);
    } catch (...) {
        log(reasonOfException());
        return EXIT_FAILURE;
    }
    return EXIT_SUCCESS;
}

}  // namespace qvct::contentdb
