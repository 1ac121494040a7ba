#pragma once

#include "platform/base/Export.h"
#include "platform/base/ObjectSet.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTagging.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <unordered_map>
#include <vector>

namespace qvct {

/// What a collection of taggings needs to know of a file node.
class QVCT_API FileURLNode {
  public:
    virtual ~FileURLNode() = default;
    virtual URL fileURL() const = 0;
};

/// How many of the given nodes have a tagging.
enum TaggingState : std::int64_t { kTaggingStateNone = 0, kTaggingStateAll = 1, kTaggingStateSome = 2 };

/// The taggings of several file nodes at once, such as of an editor's selection.
///
/// Nodes are told apart by their URL. Null nodes are ignored.
class QVCT_API TGRTTaggingCollection {
  public:
    using Node = std::shared_ptr<FileURLNode>;
    using Taggings = ObjectSet<TGRTTagging>;

    /// Replaces what the node has.
    void setTaggings(const Taggings& taggings, const Node& forNode);
    /// Adds those that the node does not have yet.
    void addTaggings(const Taggings& taggings, const Node& forNode);
    /// Takes out those that the node has.
    void removeTaggings(const Taggings& taggings, const Node& forNode);
    /// @{
    /// The same for each of several nodes.
    void setTaggings(const Taggings& taggings, const std::vector<Node>& forNodes);
    void addTaggings(const Taggings& taggings, const std::vector<Node>& forNodes);
    void removeTaggings(const Taggings& taggings, const std::vector<Node>& forNodes);
    /// @}

    /// The taggings of all nodes.
    Taggings taggings() const;
    /// Nodes whose taggings were never set do not count; kTaggingStateNone if there are no others.
    TaggingState taggingStateForTagging(const TGRTTagging& tagging, const std::vector<Node>& andNodes) const;

  private:
    Taggings& taggingsOfNode(const FileURLNode& node);

    std::vector<Taggings> taggingsOfNodes_;
    std::unordered_map<std::string, std::size_t> indexOfURL_;
};

}  // namespace qvct
