#pragma once

#include "CommandLine.h"
#include "autotagging/QVTaggingAggregator.h"
#include "formats/library/LinkRule.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace qvct::tool {

class ToolContext;

/// The options of the commands that derive tags of files.
struct TaggerOptions {
    std::vector<std::string> paths;
    LinksOutside links = LinksOutside::files;
    std::vector<std::string> services;
    std::string keywordsFile;
    std::string rulesFile;

    /// Adds "paths", and answers it; "--follow", "--services", "--keywords" and "--rules", all of which
    /// exclude `other` if it is given.
    Option addTo(Command& command, const Option* other = nullptr);
    /// Files that cannot be used are reported, and the built-in ones taken.
    std::shared_ptr<QVTaggingAggregator> aggregator(ToolContext& context) const;
};

}  // namespace qvct::tool
