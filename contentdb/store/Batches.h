#pragma once

#include "contentdb/store/StoreWriter.h"

#include <cstddef>
#include <cstdint>

namespace qvct::contentdb {

/// How much waits to be committed. Bounded, so that a transaction stays small in memory and in the log.
class BatchSize {
  public:
    void add(std::size_t terms) {
        ++items_;
        terms_ += terms;
    }
    bool isFull() const { return items_ >= kMostItems || terms_ >= kMostTerms; }

  private:
    static constexpr std::size_t kMostItems = 8192, kMostTerms = 1'000'000;

    std::size_t items_ = 0;
    std::size_t terms_ = 0;
};

/// Stores many items in batches of bounded size. A batch is open from the beginning; call `end` after the
/// last item.
class Batches {
  public:
    explicit Batches(StoreWriter& writer) : writer_(writer) { writer_.begin(); }

    /// An item with its terms, sorted (see termsOf).
    void put(ItemId id, const IndexedItem& item, const std::vector<std::string>& terms) {
        if (size_.isFull()) {
            writer_.commit();
            writer_.begin();
            size_ = {};
        }
        writer_.put(id, item, terms);
        size_.add(terms.size());
        ++items_;
    }
    std::int64_t items() const { return items_; }
    void end() { writer_.commit(); }

  private:
    StoreWriter& writer_;
    BatchSize size_;
    std::int64_t items_ = 0;
};

}  // namespace qvct::contentdb
