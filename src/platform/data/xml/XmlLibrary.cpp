#include "platform/data/xml/XmlLibrary.h"

#include <libxml/parser.h>
#include <libxml/tree.h>
#include <libxml/xpath.h>

namespace qvct {

void prepareXmlLibrary() {
    static const bool isPrepared = (xmlInitParser(), true);
    static_cast<void>(isPrepared);
}

void XmlCloser::operator()(xmlBuffer* buffer) const {
    xmlBufferFree(buffer);
}

void XmlCloser::operator()(xmlDoc* document) const {
    xmlFreeDoc(document);
}

void XmlCloser::operator()(xmlParserCtxt* parser) const {
    xmlFreeDoc(parser->myDoc);
    parser->myDoc = nullptr;
    xmlFreeParserCtxt(parser);
}

void XmlCloser::operator()(xmlXPathCompExpr* expression) const {
    xmlXPathFreeCompExpr(expression);
}

void XmlCloser::operator()(xmlXPathContext* context) const {
    xmlXPathFreeContext(context);
}

void XmlCloser::operator()(xmlXPathObject* object) const {
    xmlXPathFreeObject(object);
}

void XmlCloser::operator()(xmlChar* text) const {
    xmlFree(text);
}

}  // namespace qvct
