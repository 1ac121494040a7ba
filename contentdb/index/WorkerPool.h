#pragma once

#include "contentdb/index/DescriberPool.h"

#include <chrono>
#include <memory>
#include <string>
#include <vector>

namespace qvct::contentdb {

/// Describes items in worker programs, so that an item that crashes or hangs its describer costs that process
/// only: it is ended and replaced, and the item comes back as failed. What workers log is logged here.
///
/// They end with the pool, and with the process that has it.
class WorkerPool : public DescriberPool {
  public:
    struct Settings {
        std::string program;
        std::vector<std::string> arguments;
        unsigned workers = 1;
        /// Longest that one item may take.
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
    enum class Receipt { intact, ended, refused };

    bool start(Worker& worker);
    Receipt receive(Worker& worker, const std::function<void(Described)>& take);
    Receipt takeReport(Worker& worker, std::string_view message, const std::function<void(Described)>& take);
    bool replace(Worker& worker, const std::function<void(Described)>& take);
    std::string end(Worker& worker) const;
    void endIfLate(Worker& worker) const;
    bool fail(std::string reason);

    const Settings settings_;
    std::vector<Worker> workers_;
    unsigned barren_ = 0;  ///< Workers that ended, one after the other, without having described anything.
    Error problem_;
};

}  // namespace qvct::contentdb
