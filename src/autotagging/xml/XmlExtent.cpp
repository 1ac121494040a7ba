#include "autotagging/xml/XmlExtent.h"

#include <algorithm>
#include <cstdint>
#include <unordered_map>

#include <libxml/tree.h>

namespace qvct {
namespace {

std::size_t sum(std::size_t a, std::size_t b) {
    return a > SIZE_MAX - b ? SIZE_MAX : a + b;
}

std::size_t sizeOf(const xmlChar* text) {
    return text == nullptr ? 0 : static_cast<std::size_t>(xmlStrlen(text));
}

class Measurement {
  public:
    XmlExtent extent;

    /// The text of these nodes. The parser reads 256 levels of elements, and 40 of entities.
    std::size_t add(const xmlNode* siblings) {
        std::size_t text = 0;
        for (const xmlNode* node = siblings; node != nullptr; node = node->next) {
            ++extent.nodes;
            if (node->type != XML_ELEMENT_NODE) {
                text = sum(text, textOf(*node));
                continue;
            }
            addAttributes(*node);
            const std::size_t inside = add(node->children);
            extent.elementTexts = sum(extent.elementTexts, inside);
            text = sum(text, inside);
        }
        return text;
    }

  private:
    void addAttributes(const xmlNode& element) {
        for (const xmlAttr* attribute = element.properties; attribute != nullptr;
             attribute = attribute->next) {
            ++extent.nodes;
            if (attribute->atype == XML_ATTRIBUTE_ID) ++extent.ids;
            const std::size_t text = textOfAll(attribute->children);
            extent.longestAttribute = std::max(extent.longestAttribute, text);
            extent.attributeTexts = sum(extent.attributeTexts, text);
        }
    }

    std::size_t textOfAll(const xmlNode* siblings) {
        std::size_t text = 0;
        for (const xmlNode* node = siblings; node != nullptr; node = node->next)
            text = sum(text, textOf(*node));
        return text;
    }

    std::size_t textOf(const xmlNode& node) {
        if (node.type == XML_ELEMENT_NODE) return textOfAll(node.children);
        return node.type == XML_ENTITY_REF_NODE ? textOfEntity(node) : sizeOf(node.content);
    }

    /// Computed once for all references; 0 while it is being computed, so that an entity that contains itself
    /// adds nothing.
    std::size_t textOfEntity(const xmlNode& reference) {
        const xmlEntity* entity = xmlGetDocEntity(reference.doc, reference.name);
        if (entity == nullptr) return 0;
        const auto [hit, isNew] = entities_.emplace(entity, 0);
        if (!isNew) return hit->second;
        const std::size_t text =
            entity->children != nullptr ? textOfAll(entity->children) : sizeOf(entity->content);
        return entities_[entity] = text;
    }

    std::unordered_map<const xmlEntity*, std::size_t> entities_;
};

}  // namespace

XmlExtent extentOf(const xmlDoc& document) {
    Measurement measured;
    measured.extent.text = measured.add(document.children);
    return measured.extent;
}

}  // namespace qvct
