#pragma once

#include "platform/base/Object.h"
#include "platform/files/Paths.h"

#include <string_view>

namespace qvct::contentdb {

/// The share of the items that a run takes, numbered from 1. An item's path decides which share it belongs
/// to, so that all runs agree.
struct Part {
    unsigned number = 1;
    unsigned count = 1;

    bool holds(std::string_view folder, std::string_view name) const {
        return count <= 1 || stringHash(pathIn(folder, name)) % count == number - 1;
    }
    bool operator==(const Part&) const = default;
};

}  // namespace qvct::contentdb
