#pragma once

#include "contentdb/store/StoreWriter.h"

namespace qvct::contentdb {

/// Stores many items in batches of bounded size. A batch is open from the beginning; call `end` after the
/// last item.
class Batches {
  public:
    explicit Batches(StoreWriter& writer) : writer_(writer) { writer_.begin(); }

    /// To be called for each item put.
    void count() {
        if (++items_ % kItems != 0) return;
        writer_.commit();
        writer_.begin();
    }
    std::int64_t items() const { return items_; }
    void end() { writer_.commit(); }

  private:
    static constexpr std::int64_t kItems = 8192;

    StoreWriter& writer_;
    std::int64_t items_ = 0;
};

}  // namespace qvct::contentdb
