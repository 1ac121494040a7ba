#pragma once

#include "autotagging/xml/QVSKXMLNode.h"
#include "platform/base/Export.h"
#include "platform/text/Url.h"

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

class ItemFile;
class ScriptContext;

/// What scripts may call on the global `document`, and nothing else.
class QVCT_API QVCTXMLDocumentExport {
  public:
    virtual ~QVCTXMLDocumentExport() = default;

    /// Whether the expression selects at least one node. An invalid expression, or one whose value is a
    /// number, a text or a boolean, selects none.
    virtual bool isMatchingXPath(std::string_view expression) const = 0;
    /// The first selected node as JSON (see `QVCTXMLParser` for its shape), or nothing.
    virtual std::optional<std::string> JSONStringForXPath(std::string_view expression) const = 0;
    /// The whole document as JSON, or nothing.
    virtual std::optional<std::string> JSONString() const = 0;
};

/// The XML description of a patch or settings file, for rules and scripts to look into.
///
/// Malformed XML is recovered up to where it makes sense. Nothing outside the file is ever read: no network,
/// no external entities, no external document type. Elements deeper than 256 levels and whatever follows them
/// are dropped; entities that would multiply the text end the document where they are used. Files and what
/// comes out of compressed ones are at most 256 MiB; memory is about six times the text.
///
/// Immutable once made. Queries share state: use a document from one thread at a time.
class QVCT_API QVCTXMLDocument : public QVCTXMLDocumentExport {
  public:
    /// Reads the file; the extension "zxml" (in lower case only) says that it is compressed. Never null: a
    /// file that cannot be read or holds nothing gives a document without content, and a message in the log.
    static std::shared_ptr<QVCTXMLDocument> initWithContentsOfURL(const URL& url);
    /// The same for a file that may be open already.
    static std::shared_ptr<QVCTXMLDocument> initWithContentsOfFile(ItemFile& file);
    /// Reads a compressed file (gzip, zlib or Zstandard), whatever its extension.
    static std::shared_ptr<QVCTXMLDocument> initWithContentsOfQVZippedXMLURL(const URL& url);
    /// Parses text; `name` stands in messages.
    static std::shared_ptr<QVCTXMLDocument> initWithXMLData(std::string_view text, std::string_view name);
    ~QVCTXMLDocument() override;

    bool hasContent() const;

    /// All selected nodes in document order; empty where `isMatchingXPath` is false.
    std::vector<std::shared_ptr<QVSKXMLNode>> nodesForXPath(std::string_view expression) const;
    /// The first of them, or null. Where the expression allows it, the search stops there.
    std::shared_ptr<QVSKXMLNode> firstNodeForXPath(std::string_view expression) const;
    /// Whether the expression selects a node.
    bool anyNodesForXPath(std::string_view expression) const;

    bool isMatchingXPath(std::string_view expression) const override;
    std::optional<std::string> JSONStringForXPath(std::string_view expression) const override;
    std::optional<std::string> JSONString() const override;

    /// The document as XML, not indented anew; empty when there is no content.
    std::string XMLData() const;
    /// The JSON of a document's XML text; nothing when it has no content.
    static std::optional<std::string> JSONStringWithData(std::string_view data);

    /// The script context that the document is exposed in at the moment. Not used by the document itself.
    std::shared_ptr<ScriptContext> context() const { return context_.lock(); }
    void setContext(const std::shared_ptr<ScriptContext>& context) { context_ = context; }

  private:
    struct Implementation;
    explicit QVCTXMLDocument(std::unique_ptr<Implementation> implementation);

    std::unique_ptr<Implementation> implementation_;
    std::weak_ptr<ScriptContext> context_;
};

}  // namespace qvct
