#pragma once

#include <algorithm>
#include <cstddef>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace qvct {

/// Counts how often each text was added; keeps the order of first additions. Lookups are linear: such sets
/// hold a handful of texts.
class CountedSet {
  public:
    /// A text and how often it was added.
    struct Entry {
        std::string text;
        std::size_t count;
        bool operator==(const Entry&) const = default;
    };

    /// Adds `times` to the count of the text.
    void add(std::string_view text, std::size_t times = 1) {
        const auto hit = find(text);
        if (hit == entries_.end()) {
            entries_.push_back({std::string(text), times});
        } else {
            entries_[static_cast<std::size_t>(hit - entries_.begin())].count += times;
        }
    }

    /// 0 when it was never added.
    std::size_t count(std::string_view text) const {
        const auto hit = find(text);
        return hit == entries_.end() ? 0 : hit->count;
    }

    std::size_t size() const { return entries_.size(); }
    bool empty() const { return entries_.empty(); }
    auto begin() const { return entries_.begin(); }
    auto end() const { return entries_.end(); }
    bool operator==(const CountedSet&) const = default;

  private:
    std::vector<Entry>::const_iterator find(std::string_view text) const {
        return std::find_if(entries_.begin(), entries_.end(),
                            [text](const Entry& e) { return e.text == text; });
    }

    std::vector<Entry> entries_;
};

}  // namespace qvct
