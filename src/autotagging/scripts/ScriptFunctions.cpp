#include "autotagging/scripts/ScriptFunctions.h"

#include "autotagging/scripts/RegularExpressionGuard.h"
#include "autotagging/scripts/ScriptContext.h"
#include "autotagging/scripts/ScriptValues.h"
#include "autotagging/xml/QVCTXMLDocument.h"
#include "platform/base/Log.h"

#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

thread_local ScriptHost* running = nullptr;

std::u16string_view viewOf(JSStringRef string) {
    return {reinterpret_cast<const char16_t*>(engine().JSStringGetCharactersPtr(string)),
            engine().JSStringGetLength(string)};
}

std::string argument(JSContextRef context, std::size_t count, const JSValueRef values[], std::size_t index,
                     JSValueRef* exception) {
    return textOf(context, index < count ? values[index] : engine().JSValueMakeUndefined(context), exception);
}

JSValueRef valueOf(JSContextRef context, const std::optional<std::string>& text) {
    return text ? engine().JSValueMakeString(context, scriptString(*text).get())
                : engine().JSValueMakeNull(context);
}

JSValueRef logMessage(JSContextRef context, JSObjectRef /*function*/, JSObjectRef /*self*/, size_t count,
                      const JSValueRef values[], JSValueRef* exception) {
    const std::string message = argument(context, count, values, 0, exception);
    const int number = ++running->messages;
    if (number <= kMostScriptMessages) {
        log(fmt::format("JavaScript: {}", std::string_view(message).substr(0, kLongestScriptMessage)));
    } else if (number == kMostScriptMessages + 1) {
        log("JavaScript: (further messages of this script are dropped)");
    }
    return engine().JSValueMakeUndefined(context);
}

JSValueRef checkExpression(JSContextRef context, JSObjectRef /*function*/, JSObjectRef /*self*/, size_t count,
                           const JSValueRef values[], JSValueRef* exception) {
    if (count < 4) return engine().JSValueMakeUndefined(context);
    const ScriptString pattern(engine().JSValueToStringCopy(context, values[0], exception));
    const ScriptString flags(engine().JSValueToStringCopy(context, values[1], exception));
    const ScriptString text(engine().JSValueToStringCopy(context, values[2], exception));
    const double last = engine().JSValueToNumber(context, values[3], exception);
    if (!pattern || !flags || !text) return engine().JSValueMakeUndefined(context);
    const std::size_t start = last > 0 && last < 1e9 ? static_cast<std::size_t>(last) : 0;
    if (!isRegularExpressionBounded(viewOf(pattern.get()), viewOf(flags.get()), viewOf(text.get()), start,
                                    running->deadline)) {
        const std::string reason =
            fmt::format("regular expression takes too long: /{}/", textOf(pattern.get()));
        *exception = engine().JSValueMakeString(context, scriptString(reason).get());
    }
    return engine().JSValueMakeUndefined(context);
}

JSValueRef isMatchingXPath(JSContextRef context, JSObjectRef /*function*/, JSObjectRef /*self*/, size_t count,
                           const JSValueRef values[], JSValueRef* exception) {
    const std::string expression = argument(context, count, values, 0, exception);
    return engine().JSValueMakeBoolean(context, running->document->isMatchingXPath(expression));
}

JSValueRef jsonStringForXPath(JSContextRef context, JSObjectRef /*function*/, JSObjectRef /*self*/,
                              size_t count, const JSValueRef values[], JSValueRef* exception) {
    const std::string expression = argument(context, count, values, 0, exception);
    return valueOf(context, running->document->JSONStringForXPath(expression));
}

JSValueRef jsonString(JSContextRef context, JSObjectRef /*function*/, JSObjectRef /*self*/, size_t /*count*/,
                      const JSValueRef /*values*/[], JSValueRef* /*exception*/) {
    return valueOf(context, running->document->JSONString());
}

JSClassRef documentClass() {
    static const JSClassRef made = [] {
        constexpr JSPropertyAttributes fixed = kJSPropertyAttributeReadOnly | kJSPropertyAttributeDontDelete;
        static const JSStaticFunction functions[] = {{"isMatchingXPath", isMatchingXPath, fixed},
                                                     {"JSONStringForXPath", jsonStringForXPath, fixed},
                                                     {"JSONString", jsonString, fixed},
                                                     {nullptr, nullptr, 0}};
        JSClassDefinition definition{};
        definition.className = "QVCTXMLDocument";
        definition.staticFunctions = functions;
        return engine().JSClassCreate(&definition);
    }();
    return made;
}

}  // namespace

ScriptHost::ScriptHost(std::chrono::steady_clock::time_point end)
    : deadline(end), outer_(std::exchange(running, this)) {}

ScriptHost::~ScriptHost() {
    running = outer_;
}

/// `console` is an object of our own, since making the engine's takes longer than most scripts run.
void defineLog(JSContextRef context) {
    const JSObjectRef global = engine().JSContextGetGlobalObject(context);
    const JSObjectRef logFunction = engine().JSObjectMakeFunctionWithCallback(context, nullptr, logMessage);
    const JSObjectRef console = engine().JSObjectMake(context, nullptr, nullptr);
    for (const char* name : {"log", "info", "warn", "error", "debug"}) {
        setProperty(context, console, name, logFunction);
    }
    setProperty(context, global, "console", console);
    setProperty(context, global, "__log", logFunction);
}

JSObjectRef documentObject(JSContextRef context) {
    return engine().JSObjectMake(context, documentClass(), nullptr);
}

JSObjectRef expressionCheck(JSContextRef context) {
    return engine().JSObjectMakeFunctionWithCallback(context, nullptr, checkExpression);
}

}  // namespace qvct
