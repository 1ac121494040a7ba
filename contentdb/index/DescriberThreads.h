#pragma once

#include "contentdb/index/DescriberPool.h"

#include <condition_variable>
#include <deque>
#include <mutex>
#include <thread>

namespace qvct::contentdb {

/// Describes items in threads of this process, each with a describer of its own. An item that crashes or
/// hangs one of them crashes or hangs the process.
class DescriberThreads : public DescriberPool {
  public:
    DescriberThreads(DescriberFactory factory, unsigned threads);
    DescriberThreads(const DescriberThreads&) = delete;
    DescriberThreads& operator=(const DescriberThreads&) = delete;
    /// Waits until each thread has finished the item that it is working on.
    ~DescriberThreads() override;

    bool hasRoom() const override;
    void submit(ItemTask task) override;
    bool isBusy() const override;
    bool collect(const std::function<void(Described)>& take) override;
    Error problem() const override;

  private:
    void start();
    void work();
    void describeAll(ItemDescriber& describer);
    void give(std::string problem);

    DescriberFactory factory_;
    const unsigned threads_;
    std::vector<std::thread> running_;

    mutable std::mutex mutex_;
    std::condition_variable hasTask_;
    std::condition_variable hasResult_;
    std::deque<ItemTask> waiting_;
    std::vector<Described> ready_;
    std::size_t onTheirWay_ = 0;  ///< Submitted and not yet taken.
    Error problem_;
    bool isOver_ = false;
};

}  // namespace qvct::contentdb
