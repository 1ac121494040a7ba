// Whatever the text: XML and its JSON without a crash, and the JSON only of text that has one root element.

#include "ExactInput.h"
#include "autotagging/xml/QVCTXMLDocument.h"
#include "autotagging/xml/QVCTXMLParser.h"
#include "platform/base/Log.h"
#include "platform/files/reading/Decompression.h"
#include "platform/text/Text.h"

using namespace qvct;

extern "C" int LLVMFuzzerInitialize(int* /*count*/, char*** /*values*/) {
    setLogHandler([](std::string_view /*message*/) {});
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const fuzz::ExactInput input(data, size);
    if (const auto plain = decompress(input.bytes()))
        fuzz::require(plain->size() <= size * kHighestCompressionRatio);
    const auto dictionary = QVCTXMLParser::dictionaryForXMLData(input.text());
    fuzz::require(!dictionary || dictionary->size() == 1);
    const auto document = QVCTXMLDocument::initWithXMLData(input.text(), "fuzz");
    fuzz::require(document->hasContent() || !document->isMatchingXPath("/*"));
    const auto json = document->JSONString();
    fuzz::require(!json || isValidUtf8(*json));
    fuzz::require(!dictionary || document->hasContent());
    // Whether an element is told to the parser from the tree or from its text makes no difference.
    fuzz::require(json == QVCTXMLDocument::JSONStringWithData(document->XMLData()));
    for (const char* path : {"/*", "//*[2]", "//*[@*]"}) {
        const auto node = document->firstNodeForXPath(path);
        fuzz::require(!node || document->JSONStringForXPath(path) ==
                                   QVCTXMLDocument::JSONStringWithData(node->XMLData()));
    }
    return 0;
}
