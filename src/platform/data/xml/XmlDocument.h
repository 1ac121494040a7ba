#pragma once

#include "platform/base/Error.h"

#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// A parsed XML document, for reading single values out of it.
///
/// Malformed XML is recovered up to where it makes sense. Nothing outside the text is ever read: no network,
/// no external entities or document types. The XML library's own bounds on depth, names and the growth of
/// entities apply, and those of XmlParsing.h on attributes, name spaces, elements and encodings: what exceeds
/// them is left out, or nothing is read. Use a document from one thread at a time.
class XmlDocument {
  public:
    /// A name that ends in ".zxml" says that the file is compressed. Null, and an error, when the file cannot
    /// be read, is too large, or holds nothing.
    static std::shared_ptr<XmlDocument> fromFile(const std::string& path, Error* error = nullptr);
    /// `name` stands in messages.
    static std::shared_ptr<XmlDocument> fromText(std::string_view text, std::string_view name,
                                                 Error* error = nullptr);
    ~XmlDocument();

    /// The attribute of each node that the XPath expression selects, in document order; empty where a node
    /// has none. No values for a wrong expression.
    std::vector<std::string> attributeValues(const std::string& xpath, const std::string& attribute) const;

  private:
    struct Implementation;
    explicit XmlDocument(std::unique_ptr<Implementation> implementation);

    std::unique_ptr<Implementation> implementation_;
};

}  // namespace qvct
