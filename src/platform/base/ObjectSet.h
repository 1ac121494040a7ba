#pragma once

#include <algorithm>
#include <cstddef>
#include <memory>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

namespace qvct {

/// A set of shared objects that compares them by `isEqual` and `hash` and keeps the order of insertion,
/// so that whatever is made from it is the same in every run.
///
/// `T` is a class with `isEqual(const Object&)` and `hash()`. Null pointers are ignored.
/// @cost  insert and lookup O(1) on average, removal O(size).
template <typename T>
class ObjectSet {
  public:
    using Pointer = std::shared_ptr<T>;

    ObjectSet() = default;
    /// The objects, leaving out any that equals an earlier one.
    ObjectSet(std::initializer_list<Pointer> objects) {
        for (const Pointer& object : objects) insert(object);
    }

    /// Adds the object unless an equal one is there. Returns whether it was added.
    bool insert(Pointer object) {
        if (!object || contains(*object)) return false;
        byHash_.emplace(object->hash(), object.get());
        objects_.push_back(std::move(object));
        return true;
    }

    /// Adds every object of `other` that is not there yet.
    void insertAll(const ObjectSet& other) {
        for (const Pointer& object : other) insert(object);
    }

    /// Removes the equal object. False when there was none.
    bool erase(const T& object) {
        const T* member = find(object);
        if (member == nullptr) return false;
        const auto [first, last] = byHash_.equal_range(object.hash());
        byHash_.erase(std::find_if(first, last, [member](const auto& e) { return e.second == member; }));
        objects_.erase(std::find_if(objects_.begin(), objects_.end(),
                                    [member](const Pointer& p) { return p.get() == member; }));
        return true;
    }

    /// The member that equals `object`, or null.
    const T* find(const T& object) const {
        return findWithHash(object.hash(), [&](const T& member) { return member.isEqual(object); });
    }

    /// The member with that hash that the predicate accepts, or null.
    template <typename Predicate>
    T* findWithHash(std::size_t hash, Predicate accepts) const {
        const auto [first, last] = byHash_.equal_range(hash);
        const auto hit = std::find_if(first, last, [&](const auto& e) { return accepts(*e.second); });
        return hit == last ? nullptr : hit->second;
    }

    /// Whether an equal object is a member.
    bool contains(const T& object) const { return find(object) != nullptr; }
    std::size_t size() const { return objects_.size(); }
    bool empty() const { return objects_.empty(); }
    /// The objects in the order of insertion.
    const std::vector<Pointer>& ordered() const& { return objects_; }
    /// A copy when called on a temporary: a loop over `set().ordered()` would otherwise outlive the set.
    std::vector<Pointer> ordered() && { return std::move(objects_); }
    auto begin() const { return objects_.begin(); }
    auto end() const { return objects_.end(); }

    /// Same members, in whatever order.
    bool operator==(const ObjectSet& other) const {
        return size() == other.size() && std::all_of(begin(), end(), [&other](const Pointer& object) {
                   return other.contains(*object);
               });
    }

    /// The descriptions of the objects, in braces.
    std::string description() const {
        std::string text;
        for (const Pointer& object : objects_) text += (text.empty() ? "" : ", ") + object->description();
        return "{" + text + "}";
    }

  private:
    std::vector<Pointer> objects_;
    std::unordered_multimap<std::size_t, T*> byHash_;
};

}  // namespace qvct
