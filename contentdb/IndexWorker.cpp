#include "contentdb/IndexWorker.h"

#include "contentdb/index/WorkerMessages.h"
#include "contentdb/index/WorkerSettings.h"
#include "platform/base/Log.h"
#include "platform/base/Version.h"
#include "platform/processes/HardLimit.h"
#include "platform/processes/ParentProcess.h"

#include <cstdlib>
#include <exception>
#include <utility>

namespace qvct::contentdb {
namespace {

/// Answers are gathered up to this size and then sent, or as soon as there is nothing else to do.
constexpr std::size_t kAnswersAtOnce = 1U << 16U;

class Worker {
  public:
    explicit Worker(ParentProcess parent)
        : parent_(std::move(parent)), status_(WorkerStatus::in(parent_.memory())) {
        setLogHandler([this](std::string_view line) { logToParent(line); });
    }
    Worker(const Worker&) = delete;
    Worker& operator=(const Worker&) = delete;
    ~Worker() { setLogHandler(nullptr); }

    void run(const DescriberFactory& factory) {
        appendMessage(output_, encodedReport(WorkerReport::Kind::version, version()));
        if (!receiveSettings()) return;
        const auto describer = factory();
        if (!describer) return;
        status_.hasDescriber = true;
        while (describeAll(*describer) && receive()) {
        }
    }

  private:
    /// Sends what there is to be sent before it waits for more.
    bool receive() {
        return (output_.empty() || parent_.hasInput() || parent_.send(output_)) && parent_.receive(input_);
    }

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
            status_.since = WorkerStatus::now();
            status_.ticket = task.ticket;
            appendMessage(output_, encodedReport(describedBy(describer, task)));
            status_.ticket = 0;
            if (output_.size() >= kAnswersAtOnce && !parent_.send(output_)) return false;
        }
        input_.erase(0, at);
        return true;
    }

    /// Sent at once, since this process may end at any moment.
    void logToParent(std::string_view line) {
        appendMessage(output_, encodedReport(WorkerReport::Kind::logged, line));
        parent_.send(output_);
    }

    ParentProcess parent_;
    WorkerStatus& status_;
    std::string input_;
    std::string output_;
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
    } catch (const std::exception& fault) {
        log(fault.what());
        return EXIT_FAILURE;
    }
    return EXIT_SUCCESS;
}

}  // namespace qvct::contentdb
