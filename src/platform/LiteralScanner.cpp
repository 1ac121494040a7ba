#include "platform/LiteralScanner.h"

#include <algorithm>
#include <numeric>
#include <queue>

namespace qvct {
namespace {

unsigned char folded(unsigned char byte) {
    return byte >= 'A' && byte <= 'Z' ? static_cast<unsigned char>(byte + ('a' - 'A')) : byte;
}

/// The automaton as it is built: rows of classes, 0 meaning "no such child" until the failure links fill
/// them.
struct Trie {
    explicit Trie(std::size_t classes) : classCount(classes) { addState(); }

    std::uint32_t addState() {
        next.resize(next.size() + classCount);
        ending.emplace_back();
        return static_cast<std::uint32_t>(ending.size() - 1);
    }

    std::uint32_t& child(std::uint32_t state, std::size_t byteClass) {
        return next[state * classCount + byteClass];
    }

    /// Breadth first, so that the state to fall back to is complete before it is used.
    void linkFailures() {
        std::vector<std::uint32_t> fallback(ending.size(), 0);
        std::queue<std::uint32_t> open;
        for (std::size_t c = 0; c < classCount; ++c) {
            if (const std::uint32_t state = child(0, c)) open.push(state);
        }
        for (; !open.empty(); open.pop()) {
            const std::uint32_t state = open.front();
            const auto& inherited = ending[fallback[state]];
            ending[state].insert(ending[state].end(), inherited.begin(), inherited.end());
            for (std::size_t c = 0; c < classCount; ++c) {
                const std::uint32_t elsewhere = child(fallback[state], c);
                std::uint32_t& here = child(state, c);
                if (here == 0) {
                    here = elsewhere;
                } else {
                    fallback[here] = elsewhere;
                    open.push(here);
                }
            }
        }
    }

    std::size_t classCount;
    std::vector<std::uint32_t> next;
    std::vector<std::vector<std::uint32_t>> ending;
};

}  // namespace

LiteralScanner::LiteralScanner(const std::vector<std::string>& literals) {
    for (const std::string& literal : literals) {
        for (const char c : literal) {
            std::uint16_t& byteClass = classOf_[folded(static_cast<unsigned char>(c))];
            if (byteClass == 0) byteClass = static_cast<std::uint16_t>(classCount_++);
        }
    }
    for (std::size_t byte = 'A'; byte <= 'Z'; ++byte)
        classOf_[byte] = classOf_[folded(static_cast<unsigned char>(byte))];

    Trie trie(classCount_);
    for (std::uint32_t index = 0; index < literals.size(); ++index) {
        std::uint32_t state = 0;
        for (const char c : literals[index]) {
            const std::size_t byteClass = classOf_[static_cast<unsigned char>(c)];
            if (trie.child(state, byteClass) == 0) {
                const std::uint32_t added = trie.addState();
                trie.child(state, byteClass) = added;
            }
            state = trie.child(state, byteClass);
        }
        if (state != 0) trie.ending[state].push_back(index);
    }
    trie.linkFailures();

    // The start, then the states in which something ends, then the rest: one comparison tells them apart.
    const std::size_t states = trie.ending.size();
    std::vector<std::uint32_t> order(states);
    std::iota(order.begin(), order.end(), 0U);
    const auto firstResting = std::stable_partition(
        order.begin() + 1, order.end(), [&trie](std::uint32_t state) { return !trie.ending[state].empty(); });
    std::vector<std::uint32_t> rowOf(states);
    for (std::uint32_t row = 0; row < states; ++row) rowOf[order[row]] = row * classCount_;
    firstRestingState_ = static_cast<std::uint32_t>(firstResting - order.begin()) * classCount_;

    next_.reserve(states * classCount_);
    for (const std::uint32_t state : order) {
        for (std::size_t c = 0; c < classCount_; ++c) next_.push_back(rowOf[trie.child(state, c)]);
        endingStart_.push_back(static_cast<std::uint32_t>(ending_.size()));
        ending_.insert(ending_.end(), trie.ending[state].begin(), trie.ending[state].end());
    }
    endingStart_.push_back(static_cast<std::uint32_t>(ending_.size()));
}

}  // namespace qvct
