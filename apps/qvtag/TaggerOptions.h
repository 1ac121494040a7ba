#pragma once

#include "autotagging/QVTaggingAggregator.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace qvct::tool {

class Command;
class ToolContext;

/// The options of the commands that derive tags.
struct TaggerOptions {
    std::vector<std::string> services;
    std::string keywordsFile;
    std::string rulesFile;

    /// Adds "--services", "--keywords" and "--rules".
    void addTo(Command& command);
    /// Files that cannot be used are reported, and the built-in ones taken.
    std::shared_ptr<QVTaggingAggregator> aggregator(ToolContext& context) const;
};

}  // namespace qvct::tool
