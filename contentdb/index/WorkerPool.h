#pragma once

#include "contentdb/index/DescriberPool.h"

#include <chrono>
#include <memory>
#include <string>
#include <vector>

namespace qvct::contentdb {

struct WorkerReport;

/// Describes items in worker programs, so that an item that crashes or hangs its describer costs that process
/// only: it is ended and replaced, and the item comes back as failed. What workers log is logged here.
///
/// They end with the pool, and with the process that has it. What they send is not trusted: one that sends
/// nonsense, too much, or nothing for long, is ended, too.
class WorkerPool : public DescriberPool {
  public:
    struct Settings {
        std::string program;
        std::vector<std::string> arguments;
        unsigned workers = 1;
        /// Longest that one item may take, counting only while somebody is in `collect` to hear of it.
        std::chrono::milliseconds timeLimit{30000};
    };

    explicit WorkerPool(Settings settings);
    ~WorkerPool() override;

    bool hasRoom() const override;
    void submit(ItemTask task) override;
    bool isBusy() const override;
    bool collect(const std::function<void(Described)>& take) override;
    Error problem() const override { return problem_; }

  private:
    struct Worker;

    bool start(Worker& worker);
    bool receive(Worker& worker, const std::function<void(Described)>& take);
    bool takeReport(Worker& worker, WorkerReport report, const std::function<void(Described)>& take);
    void judge(Worker& worker, std::chrono::nanoseconds time) const;
    bool replace(Worker& worker, const std::function<void(Described)>& take);
    bool fail(std::string reason);

    const Settings settings_;
    const std::string settingsOfWorkers_;  ///< As they are sent: the same to all.
    std::vector<Worker> workers_;
    unsigned barren_ = 0;  ///< Workers that ended, one after the other, without having described anything.
    Error problem_;
};

}  // namespace qvct::contentdb
