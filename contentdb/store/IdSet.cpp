#include "contentdb/store/IdSet.h"

#include <cstring>

namespace qvct::contentdb {

std::uint32_t IdSet::count() const {
    return countCommon(*this);
}

std::uint32_t IdSet::countCommon(const IdSet& other) const {
    std::uint32_t result = 0;
    for (std::size_t i = 0; i < words_.size(); ++i)
        result += static_cast<std::uint32_t>(std::popcount(words_[i] & other.words_[i]));
    return result;
}

IdSet& IdSet::operator|=(const IdSet& other) {
    for (std::size_t i = 0; i < words_.size(); ++i) words_[i] |= other.words_[i];
    return *this;
}

IdSet& IdSet::operator&=(const IdSet& other) {
    for (std::size_t i = 0; i < words_.size(); ++i) words_[i] &= other.words_[i];
    return *this;
}

IdSet& IdSet::operator-=(const IdSet& other) {
    for (std::size_t i = 0; i < words_.size(); ++i) words_[i] &= ~other.words_[i];
    return *this;
}

std::string IdSet::encoded() const {
    std::string bytes;
    if (count() * sizeof(std::uint16_t) >= sizeof words_) {
        bytes.resize(sizeof words_);
        std::memcpy(bytes.data(), words_.data(), bytes.size());
        return bytes;
    }
    forEach([&bytes](std::uint16_t id) {
        bytes += static_cast<char>(id & 0xFFU);
        bytes += static_cast<char>(id >> 8U);
        return true;
    });
    return bytes;
}

bool IdSet::insertEncoded(std::string_view bytes) {
    if (bytes.size() > sizeof words_ || bytes.size() % 2 != 0) return false;
    if (bytes.size() == sizeof words_) {
        IdSet other;
        std::memcpy(other.words_.data(), bytes.data(), bytes.size());
        *this |= other;
        return true;
    }
    for (std::size_t at = 0; at < bytes.size(); at += 2) {
        const auto low = static_cast<unsigned char>(bytes[at]);
        const auto high = static_cast<unsigned char>(bytes[at + 1]);
        insert(static_cast<std::uint16_t>(low | high << 8U));
    }
    return true;
}

}  // namespace qvct::contentdb
