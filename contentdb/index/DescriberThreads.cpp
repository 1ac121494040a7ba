#include "contentdb/index/DescriberThreads.h"

#include <algorithm>
#include <chrono>
#include <system_error>
#include <utility>

namespace qvct::contentdb {
namespace {

/// Items that wait for one thread; enough that it never waits itself.
constexpr std::size_t kQueuePerThread = 128;

}  // namespace

DescriberThreads::DescriberThreads(DescriberFactory factory, unsigned threads)
    : factory_(std::move(factory)), threads_(std::max(1U, threads)) {}

DescriberThreads::~DescriberThreads() {
    {
        const std::lock_guard lock(mutex_);
        isOver_ = true;
    }
    hasTask_.notify_all();
    for (std::thread& thread : running_) thread.join();
}

bool DescriberThreads::hasRoom() const {
    const std::lock_guard lock(mutex_);
    return onTheirWay_ < kQueuePerThread * threads_;
}

void DescriberThreads::submit(ItemTask task) {
    {
        const std::lock_guard lock(mutex_);
        waiting_.push_back(std::move(task));
        ++onTheirWay_;
    }
    hasTask_.notify_one();
}

bool DescriberThreads::isBusy() const {
    const std::lock_guard lock(mutex_);
    return onTheirWay_ > 0;
}

bool DescriberThreads::collect(const std::function<void(Described)>& take) {
    constexpr std::chrono::milliseconds patience(100);
    if (running_.empty() && isBusy()) start();
    std::vector<Described> taken;
    bool isInOrder = true;
    {
        std::unique_lock lock(mutex_);
        hasResult_.wait_for(lock, patience, [this] { return !ready_.empty() || problem_.isSet(); });
        taken.swap(ready_);
        onTheirWay_ -= taken.size();
        isInOrder = !problem_.isSet();
    }
    for (Described& described : taken) take(std::move(described));
    return isInOrder;
}

Error DescriberThreads::problem() const {
    const std::lock_guard lock(mutex_);
    return problem_;
}

/// When there is work: a run that finds nothing new starts none.
void DescriberThreads::start() {
    try {
        while (running_.size() < threads_) running_.emplace_back([this] { work(); });
    } catch (const std::system_error& fault) {
        if (running_.empty()) give(std::string("no thread can be started: ") + fault.what());
    }
}

void DescriberThreads::work() {
    try {
        if (const auto describer = factory_()) {
            describeAll(*describer);
        } else {
            give("there is nothing that describes items");
        }
    } catch (...) {
        give(reasonOfException());
    }
}

void DescriberThreads::describeAll(ItemDescriber& describer) {
    while (true) {
        ItemTask task;
        {
            std::unique_lock lock(mutex_);
            hasTask_.wait(lock, [this] { return isOver_ || !waiting_.empty(); });
            if (isOver_) return;
            task = std::move(waiting_.front());
            waiting_.pop_front();
        }
        Described described = describedBy(describer, task);
        {
            const std::lock_guard lock(mutex_);
            ready_.push_back(std::move(described));
        }
        hasResult_.notify_one();
    }
}

void DescriberThreads::give(std::string problem) {
    {
        const std::lock_guard lock(mutex_);
        problem_ = errorOf(kErrorUnreadable, std::move(problem));
    }
    hasResult_.notify_one();
}

}  // namespace qvct::contentdb
