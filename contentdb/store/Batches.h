#pragma once

#include "contentdb/store/StoreWriter.h"

namespace qvct::contentdb {

/// Stores many items in batches that no memory is too small for: from the first on a batch is open, and
/// whoever has put all ends the last one.
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
