#include "autotagging/scripts/QVCTJavaScriptUtilities.h"

#include "autotagging/xml/QVCTXMLDocument.h"
#include "platform/files/FileAccess.h"
#include "resources/QVCTCompiledResources.h"
#include "resources/ReplacementFile.h"

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
    static const auto library = QVCTCompiledResources::QVSearchKitJS();
    const auto read = [](const std::string& path) { return readTextFile(path); };
    return replacedOrBuiltIn({name, "js"}, read, [] { return library; }).value_or("");
}

}  // namespace

std::optional<PropertyList::Array> QVCTJavaScriptUtilities::tagsForXMLDocument(
    const std::shared_ptr<QVCTXMLDocument>& document, std::string_view javaScript) {
    if (!document) return PropertyList::Array{};
    const std::shared_ptr<ScriptContext> context = ScriptContext::make(limits());
    if (!context) return std::nullopt;
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
