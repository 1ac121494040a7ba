#pragma once

#include "platform/base/Export.h"

#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// The names that may say what an item is: its own, without extension, then its folder's, and so on outwards.
class QVCT_API ItemNames {
  public:
    /// Up to the folder that was named, whose own name counts, or of a file that was named itself up to two
    /// folders. An empty root stands for the item.
    explicit ItemNames(std::string path, std::string_view root = {});
    ItemNames(const ItemNames&) = delete;
    ItemNames& operator=(const ItemNames&) = delete;

    /// As long as this object lives.
    std::span<const std::string_view> all() const { return names_; }
    /// That of its own name, without the dot; empty when it has none. As long as this object lives.
    std::string_view extension() const { return extension_; }
    /// The paths of the folders whose names are among them, in the same order; as long as this object lives.
    std::vector<std::string_view> folders() const;

  private:
    std::string path_;
    std::vector<std::string_view> names_;
    std::string_view extension_;
};

}  // namespace qvct
