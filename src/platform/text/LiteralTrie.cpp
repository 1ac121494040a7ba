#include "platform/text/LiteralTrie.h"

#include <numeric>

namespace qvct {
namespace {

unsigned char lowercased(char c) {
    const auto byte = static_cast<unsigned char>(c);
    return byte >= 'A' && byte <= 'Z' ? static_cast<unsigned char>(byte + ('a' - 'A')) : byte;
}

}  // namespace

LiteralTrie::LiteralTrie(const std::vector<std::string>& literals) {
    for (const std::string& literal : literals) {
        for (const char c : literal) {
            std::uint16_t& byteClass = classOf_[lowercased(c)];
            if (byteClass == 0) byteClass = static_cast<std::uint16_t>(classCount_++);
        }
    }
    for (char c = 'A'; c <= 'Z'; ++c) classOf_[static_cast<unsigned char>(c)] = classOf_[lowercased(c)];

    // For as many nodes as there can be: memory that is not reached is not touched, and nothing moves.
    const std::size_t bytes =
        std::accumulate(literals.begin(), literals.end(), std::size_t{0},
                        [](std::size_t sum, const std::string& literal) { return sum + literal.size(); });
    child_.reserve((bytes + 1) * classCount_);
    child_.resize(classCount_);
    literalAt_.push_back(-1);
    for (std::size_t index = 0; index < literals.size(); ++index) {
        std::uint32_t node = 0;
        for (const char c : literals[index]) {
            const std::size_t place = node * classCount_ + classOf_[static_cast<unsigned char>(c)];
            if (child_[place] == 0) {
                child_[place] = static_cast<std::uint32_t>(literalAt_.size());
                child_.resize(child_.size() + classCount_);
                literalAt_.push_back(-1);
            }
            node = child_[place];
        }
        if (node != 0) literalAt_[node] = static_cast<std::int32_t>(index);
    }
}

}  // namespace qvct
