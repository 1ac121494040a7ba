#pragma once

#include "platform/base/Export.h"

#include <cstddef>
#include <string>
#include <string_view>

namespace qvct {

/// Base of every model object: equality, hash and a description for people.
///
/// By default an object equals only itself.
class QVCT_API Object {
  public:
    Object() = default;
    Object(const Object&) = delete;
    Object& operator=(const Object&) = delete;
    virtual ~Object() = default;

    /// Whether both stand for the same value. Equal objects have equal hashes.
    virtual bool isEqual(const Object& other) const { return this == &other; }
    virtual std::size_t hash() const { return reinterpret_cast<std::size_t>(this); }
    /// One line for a log: class, address and fields.
    virtual std::string description() const = 0;
};

/// Hash of a text, the same in every process and on every platform (FNV-1a, 64 bits).
constexpr std::size_t stringHash(std::string_view text) {
    std::size_t hash = 0xcbf29ce484222325U;
    for (const char c : text) hash = (hash ^ static_cast<unsigned char>(c)) * 0x100000001b3U;
    return hash;
}

}  // namespace qvct
