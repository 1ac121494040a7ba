// Whatever the expression: no crash over a fixed document, and the walk of common expressions finds the node
// that the XML library finds.

#include "ExactInput.h"
#include "autotagging/xml/QVCTXMLDocument.h"
#include "platform/base/Log.h"

using namespace qvct;

extern "C" int LLVMFuzzerInitialize(int* /*count*/, char*** /*values*/) {
    setLogHandler([](std::string_view /*message*/) {});
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const auto document = QVCTXMLDocument::initWithXMLData(
        "<P xmlns:x='u' m=''><C m='Mono' v='1.50' w=' 7 ' n='abc'/><C m='Stereo' v='x' x:m='Mono'><D v='-1'/>"
        "<D v='2' k='a&amp;b'/><D/></C><x:C m='q'/>text<C m=\"it's\" v='' w='1e3'><D v='2' k='b'/>"
        "<D v='2' k='b' l='1'/><!-- c --></C></P>",
        "fuzz");
    const fuzz::ExactInput input(data, size);
    const auto all = document->nodesForXPath(input.text());
    const auto first = document->firstNodeForXPath(input.text());
    fuzz::require(all.empty() ? first == nullptr
                              : first != nullptr && first->XMLData() == all.front()->XMLData());
    fuzz::require(document->isMatchingXPath(input.text()) == !all.empty());
    return 0;
}
