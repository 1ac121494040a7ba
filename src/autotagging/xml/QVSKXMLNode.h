#pragma once

#include "platform/base/Export.h"

#include <memory>
#include <string>

struct _xmlNode;  // NOLINT(bugprone-reserved-identifier): libxml2's name

namespace qvct {

/// One matched node of an XML document, kept as its XML text, so that it outlives the document.
class QVCT_API QVSKXMLNode {
  public:
    /// Serializes the node with all below it, without indentation. Empty text when there is nothing to write.
    /// @cost  O(size of the subtree)
    static std::shared_ptr<QVSKXMLNode> initWithXMLNode(_xmlNode* node);

    const std::string& XMLData() const { return xmlData_; }

  private:
    explicit QVSKXMLNode(std::string xmlData) : xmlData_(std::move(xmlData)) {}

    std::string xmlData_;
};

}  // namespace qvct
