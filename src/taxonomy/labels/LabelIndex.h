#pragma once

#include "platform/base/Object.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <unordered_map>

namespace qvct {

class TGRTTag;

/// A label with its hash, made once for a search in several categories.
struct LabelKey {
    /// The label must live as long as the key.
    explicit LabelKey(std::string_view label) : text(label), hash(stringHash(label)) {}
    std::string_view text;
    std::size_t hash;
};

/// Finds the tags of a category by their labels, so that a search does not walk the tree. It only answers
/// what is certain: after any change of the tree other than creating tags, the tree has to be searched.
class LabelIndex {
  public:
    /// `exact` says that no other tag of the tree can have the label.
    struct Answer {
        TGRTTag* only = nullptr;
        bool exact = false;
    };

    /// A tag was created.
    void add(TGRTTag& tag, const std::string& label) {
        ++revision_;
        const auto [entry, isNew] = byLabel_.try_emplace(label, &tag);
        if (!isNew) entry->second = nullptr;
    }
    /// The tree was changed by other means.
    void treeChanged() {
        ++revision_;
        onlyCreated_ = false;
        byLabel_.clear();
    }
    /// @cost  O(1)
    Answer find(const LabelKey& label) const {
        if (!onlyCreated_) return {};
        const auto hit = byLabel_.find(label);
        return hit == byLabel_.end() ? Answer{nullptr, true} : Answer{hit->second, hit->second != nullptr};
    }
    /// Counts changes, for code that caches something derived from the tags.
    std::uint64_t revision() const { return revision_; }

  private:
    struct Hash {
        using is_transparent = void;
        std::size_t operator()(const LabelKey& key) const { return key.hash; }
        std::size_t operator()(const std::string& label) const { return stringHash(label); }
    };
    struct Equal {
        using is_transparent = void;
        bool operator()(const std::string& a, const std::string& b) const { return a == b; }
        bool operator()(const LabelKey& key, const std::string& label) const { return key.text == label; }
        bool operator()(const std::string& label, const LabelKey& key) const { return key.text == label; }
    };

    /// The tag with each label; null where several have it.
    std::unordered_map<std::string, TGRTTag*, Hash, Equal> byLabel_;
    bool onlyCreated_ = true;
    std::uint64_t revision_ = 0;
};

}  // namespace qvct
