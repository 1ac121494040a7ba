#pragma once

#include <memory>
#include <string>
#include <string_view>

// libxml2's names, declared here so that headers need none of its own.
struct _xmlBuffer;
struct _xmlDoc;
struct _xmlNode;
struct _xmlParserCtxt;
struct _xmlXPathCompExpr;
struct _xmlXPathContext;
struct _xmlXPathObject;

namespace qvct {

/// To be called before anything else of the XML library: several threads must not make its first use at once.
void prepareXmlLibrary();

/// Frees objects of the XML library; a parser together with the document that it has built so far.
struct XmlCloser {
    void operator()(_xmlBuffer* buffer) const;
    void operator()(_xmlDoc* document) const;
    void operator()(_xmlParserCtxt* parser) const;
    void operator()(_xmlXPathCompExpr* expression) const;
    void operator()(_xmlXPathContext* context) const;
    void operator()(_xmlXPathObject* object) const;
    void operator()(unsigned char* text) const;
};

/// An object of the XML library that is ours to free.
template <typename Object>
using XmlOwned = std::unique_ptr<Object, XmlCloser>;

/// The library's texts are bytes of UTF-8 with a zero behind them; null stands for an empty one.
inline std::string_view viewOf(const unsigned char* text) {
    return text == nullptr ? std::string_view{} : reinterpret_cast<const char*>(text);
}
inline const unsigned char* xmlText(const char* text) {
    return reinterpret_cast<const unsigned char*>(text);
}

}  // namespace qvct
