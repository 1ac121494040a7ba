#include "autotagging/scripts/QVCTJavaScriptUtilities.h"

#include "autotagging/xml/QVCTXMLDocument.h"
#include "platform/files/FileAccess.h"
#include "platform/files/ResourceBundle.h"
#include "resources/QVCTCompiledResources.h"

#include <mutex>
#include <string>

namespace qvct {
namespace {

std::mutex limitsMutex;

ScriptLimits& currentLimits() {
    static ScriptLimits limits;
    return limits;
}

std::string scriptResource(const std::string& name) {
    if (const auto path = ResourceBundle::pathForResource(name, "js")) {
        if (auto text = readTextFile(*path)) return *std::move(text);
    }
    static const std::string library = QVCTCompiledResources::QVSearchKitJS().value_or("");
    return library;
}

}  // namespace

std::optional<PropertyList::Array> QVCTJavaScriptUtilities::tagsForXMLDocument(
    const std::shared_ptr<QVCTXMLDocument>& document, std::string_view javaScript) {
    if (!document) return PropertyList::Array{};
    const std::shared_ptr<ScriptContext> context = ScriptContext::make(limits());
    includeJSResourceWithName("QVSearchKit", *context);
    document->setContext(context);
    context->exposeDocument(*document);
    context->evaluate(javaScript);
    return context->callForArray("main");
}

void QVCTJavaScriptUtilities::includeJSResourceWithName(std::string_view name, ScriptContext& context) {
    context.evaluate(scriptResource(std::string(name)));
}

ScriptLimits QVCTJavaScriptUtilities::limits() {
    const std::lock_guard lock(limitsMutex);
    return currentLimits();
}

void QVCTJavaScriptUtilities::setLimits(const ScriptLimits& limits) {
    const std::lock_guard lock(limitsMutex);
    currentLimits() = limits;
}

}  // namespace qvct
