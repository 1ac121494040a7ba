#include "autotagging/xml/QVSKXMLNode.h"

#include "platform/data/xml/XmlLibrary.h"

#include <libxml/tree.h>

namespace qvct {

std::shared_ptr<QVSKXMLNode> QVSKXMLNode::initWithXMLNode(_xmlNode* node) {
    if (node == nullptr) return nullptr;
    const XmlOwned<xmlBuffer> buffer(xmlBufferCreate());
    if (!buffer) return nullptr;
    std::string text;
    if (xmlNodeDump(buffer.get(), node->doc, node, 0, 0) > 0) {
        text.assign(reinterpret_cast<const char*>(xmlBufferContent(buffer.get())),
                    static_cast<std::size_t>(xmlBufferLength(buffer.get())));
    }
    return std::shared_ptr<QVSKXMLNode>(new QVSKXMLNode(std::move(text)));
}

}  // namespace qvct
