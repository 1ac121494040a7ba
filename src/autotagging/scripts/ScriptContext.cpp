#include "autotagging/scripts/ScriptContext.h"

#include "autotagging/scripts/RegularExpressionGuard.h"
#include "autotagging/scripts/ScriptGuard.h"
#include "autotagging/scripts/ScriptValues.h"
#include "autotagging/xml/QVCTXMLDocument.h"
#include "autotagging/xml/XPathDeadline.h"
#include "platform/base/Log.h"
#include "platform/processes/HardLimit.h"

#include <string>
#include <unordered_map>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

using Clock = std::chrono::steady_clock;

/// Seconds of work between two looks at the limits.
constexpr double kSlice = 0.01;
constexpr std::size_t kLongestMessage = 4096;
/// How far a script may exceed its limits before the process is ended, where that is allowed.
constexpr std::chrono::milliseconds kHardTime{1000};
constexpr std::size_t kHardMemory = std::size_t{64} << 20;

/// The virtual machine of a thread, which its contexts share.
class ContextGroup {
  public:
    ContextGroup() : group_(engine().JSContextGroupCreate()) {}
    ContextGroup(const ContextGroup&) = delete;
    ContextGroup& operator=(const ContextGroup&) = delete;
    ~ContextGroup() { engine().JSContextGroupRelease(group_); }
    JSContextGroupRef reference() const { return group_; }

  private:
    JSContextGroupRef group_;
};

std::shared_ptr<ContextGroup>& groupOfThisThread() {
    thread_local std::shared_ptr<ContextGroup> group;
    return group;
}

std::shared_ptr<ContextGroup> sharedGroup() {
    std::shared_ptr<ContextGroup>& group = groupOfThisThread();
    if (!group) group = std::make_shared<ContextGroup>();
    return group;
}

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

void setProperty(JSContextRef context, JSObjectRef object, std::string_view name, JSValueRef value) {
    engine().JSObjectSetProperty(context, object, scriptString(name).get(), value, kJSPropertyAttributeNone,
                                 nullptr);
}

JSValueRef property(JSContextRef context, JSObjectRef object, std::string_view name, JSValueRef* exception) {
    return engine().JSObjectGetProperty(context, object, scriptString(name).get(), exception);
}

/// Replaces the first letter of each occurrence of a word by an escape: in texts, expressions and names that
/// means the same, but keywords must not contain escapes. A word behind a backslash is no keyword anyway.
std::string withoutKeyword(std::string text, std::string_view word) {
    const std::string escape = fmt::format("\\u{:04x}", static_cast<unsigned char>(word.front()));
    for (std::size_t at = text.find(word); at != std::string::npos; at = text.find(word, at + 1)) {
        if (at > 0 && text[at - 1] == '\\') continue;
        text.replace(at, 1, escape);
        at += escape.size();
    }
    return text;
}

/// A rule's text as it is given to the engine: "async" and "import", whose work would go on after the
/// script's end, are no longer keywords.
struct Prepared {
    ScriptString text;
    bool isOwn = false;
};

/// Kept for this thread, since the same rules are evaluated for each item.
const Prepared& prepared(std::string_view script) {
    constexpr std::size_t mostKept = 64;
    thread_local std::unordered_map<std::string, Prepared> kept;
    std::string key(script);
    if (const auto hit = kept.find(key); hit != kept.end()) return hit->second;
    if (kept.size() >= mostKept) kept.clear();
    const std::string text = withoutKeyword(withoutKeyword(key, "async"), "import");
    Prepared made{scriptString(text), isOwnScript(script)};
    return kept.emplace(std::move(key), std::move(made)).first->second;
}

/// The engine's message; where it may be about "async" or "import", with the reason why these are unknown.
std::string withReason(const std::string& problem, std::string_view script) {
    const bool mayMissKeyword =
        problem.starts_with("SyntaxError") &&
        (script.find("async") != std::string_view::npos || script.find("import") != std::string_view::npos);
    return mayMissKeyword ? problem + " (\"async\" and \"import\" are not available to rules)" : problem;
}

}  // namespace

struct ScriptContext::Implementation {
    enum class Stop { none, time, memory, unguarded };

    ScriptLimits limits;
    Clock::time_point deadline = Clock::now() + limits.time;
    Stop stop = Stop::none;
    int messages = 0;
    const QVCTXMLDocument* document = nullptr;
    std::shared_ptr<ContextGroup> group = sharedGroup();
    JSGlobalContextRef context = engine().JSGlobalContextCreateInGroup(group->reference(), nullptr);
    bool isGuarded = false;
    std::optional<HardLimit> hardLimit;  ///< For foreign scripts, until the context has gone.

    explicit Implementation(const ScriptLimits& chosen) : limits(chosen) {
        outer = std::exchange(current, this);
        engine().JSContextGroupSetExecutionTimeLimit(group->reference(), kSlice, shouldTerminate, this);
    }
    Implementation(const Implementation&) = delete;
    Implementation& operator=(const Implementation&) = delete;

    ~Implementation() {
        engine().JSContextGroupClearExecutionTimeLimit(group->reference());
        current = outer;
        engine().JSGlobalContextRelease(context);
        // A virtual machine that was stopped may hold much memory, so the thread's next context gets a new
        // one.
        if (stop != Stop::none && groupOfThisThread() == group) groupOfThisThread().reset();
    }

    /// The context whose script calls back. Kept here and not in the global object, since the engine looks up
    /// the variables of a global object with private data slowly.
    static Implementation& running() { return *current; }

    JSObjectRef global() const { return engine().JSContextGetGlobalObject(context); }

    void logException(JSValueRef thrown, std::string_view script = {}) {
        if (stop == Stop::none && thrown != nullptr)
            logProblem(withReason(textOf(context, thrown, nullptr), script));
        if (stop != Stop::none) logStop();
    }

    static void logProblem(std::string_view text) {
        log(fmt::format("JavaScript Exception: {}", text.substr(0, kLongestMessage)));
    }

    void logStop() {
        if (std::exchange(isStopLogged, true)) return;
        if (stop == Stop::time) {
            logProblem(fmt::format("stopped after {} ms", limits.time.count()));
        } else if (stop == Stop::memory) {
            logProblem(fmt::format("stopped at more than {} MiB of memory", limits.memory >> 20U));
        }
    }

    /// Runs `work`, which enters the machine, under the limits; does nothing once one was reached.
    template <typename Work>
    void run(Work work) {
        if (stop != Stop::none) return;
        if (Clock::now() >= deadline) {
            stop = Stop::time;
        } else {
            const XPathDeadline ofExpressions(deadline);
            work();
        }
        if (stop != Stop::none) logStop();
    }

    /// Called by the machine at the end of each slice. It has to request the next slice itself, even when it
    /// says stop: calls into the machine from our own functions may swallow the stop.
    static bool shouldTerminate(JSContextRef context, void* self) {
        auto& implementation = *static_cast<Implementation*>(self);
        if (Clock::now() >= implementation.deadline) {
            implementation.stop = Stop::time;
        } else if (memoryInUse(context) > static_cast<double>(implementation.limits.memory)) {
            implementation.stop = Stop::memory;
        }
        engine().JSContextGroupSetExecutionTimeLimit(implementation.group->reference(), kSlice,
                                                     shouldTerminate, self);
        return implementation.stop != Stop::none;
    }

    static double memoryInUse(JSContextRef context) {
        const JSObjectRef statistics = engine().JSGetMemoryUsageStatistics(context);
        return engine().JSValueToNumber(context, property(context, statistics, "heapCapacity", nullptr),
                                        nullptr);
    }

    void defineLog();
    void guard();

    static JSClassRef documentClass();
    static JSValueRef logMessage(JSContextRef, JSObjectRef, JSObjectRef, size_t, const JSValueRef[],
                                 JSValueRef*);
    static JSValueRef checkExpression(JSContextRef, JSObjectRef, JSObjectRef, size_t, const JSValueRef[],
                                      JSValueRef*);
    static JSValueRef isMatchingXPath(JSContextRef, JSObjectRef, JSObjectRef, size_t, const JSValueRef[],
                                      JSValueRef*);
    static JSValueRef jsonStringForXPath(JSContextRef, JSObjectRef, JSObjectRef, size_t, const JSValueRef[],
                                         JSValueRef*);
    static JSValueRef jsonString(JSContextRef, JSObjectRef, JSObjectRef, size_t, const JSValueRef[],
                                 JSValueRef*);

    bool isStopLogged = false;
    Implementation* outer = nullptr;
    static thread_local Implementation* current;
};

thread_local ScriptContext::Implementation* ScriptContext::Implementation::current = nullptr;

JSClassRef ScriptContext::Implementation::documentClass() {
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

/// `console` is an object of our own, since making the engine's takes longer than most scripts run.
void ScriptContext::Implementation::defineLog() {
    const JSObjectRef logFunction = engine().JSObjectMakeFunctionWithCallback(context, nullptr, logMessage);
    const JSObjectRef console = engine().JSObjectMake(context, nullptr, nullptr);
    for (const char* name : {"log", "info", "warn", "error", "debug"}) {
        setProperty(context, console, name, logFunction);
    }
    setProperty(context, global(), "console", console);
    setProperty(context, global(), "__log", logFunction);
}

/// Puts what foreign scripts can reach under the guard. The library's own scripts run without it.
void ScriptContext::Implementation::guard() {
    if (std::exchange(isGuarded, true)) return;
    hardLimit.emplace(limits.time + kHardTime, limits.memory + kHardMemory,
                      LogScope::prefix() + "JavaScript");
    thread_local const ScriptString program = scriptString(scriptGuard());
    engine().JSGlobalContextSetEvalEnabled(context, false, scriptString("not available to rules").get());
    const JSValueRef function =
        engine().JSEvaluateScript(context, program.get(), nullptr, nullptr, 1, nullptr);
    const JSValueRef check = engine().JSObjectMakeFunctionWithCallback(context, nullptr, checkExpression);
    JSValueRef exception = nullptr;
    const JSObjectRef callee =
        function != nullptr ? engine().JSValueToObject(context, function, nullptr) : nullptr;
    if (callee != nullptr) engine().JSObjectCallAsFunction(context, callee, nullptr, 1, &check, &exception);
    if (callee != nullptr && exception == nullptr) return;
    logProblem("the guard of scripts does not run");
    stop = Stop::unguarded;
}

JSValueRef ScriptContext::Implementation::logMessage(JSContextRef context, JSObjectRef /*function*/,
                                                     JSObjectRef /*self*/, size_t count,
                                                     const JSValueRef values[], JSValueRef* exception) {
    const std::string message = argument(context, count, values, 0, exception);
    const int number = ++running().messages;
    if (number <= kMostScriptMessages) {
        log(fmt::format("JavaScript: {}", std::string_view(message).substr(0, kLongestMessage)));
    } else if (number == kMostScriptMessages + 1) {
        log("JavaScript: (further messages of this script are dropped)");
    }
    return engine().JSValueMakeUndefined(context);
}

JSValueRef ScriptContext::Implementation::checkExpression(JSContextRef context, JSObjectRef /*function*/,
                                                          JSObjectRef /*self*/, size_t count,
                                                          const JSValueRef values[], JSValueRef* exception) {
    if (count < 4) return engine().JSValueMakeUndefined(context);
    const ScriptString pattern(engine().JSValueToStringCopy(context, values[0], exception));
    const ScriptString flags(engine().JSValueToStringCopy(context, values[1], exception));
    const ScriptString text(engine().JSValueToStringCopy(context, values[2], exception));
    const double last = engine().JSValueToNumber(context, values[3], exception);
    if (!pattern || !flags || !text) return engine().JSValueMakeUndefined(context);
    const std::size_t start = last > 0 && last < 1e9 ? static_cast<std::size_t>(last) : 0;
    if (!isRegularExpressionBounded(viewOf(pattern.get()), viewOf(flags.get()), viewOf(text.get()), start,
                                    running().deadline)) {
        const std::string reason =
            fmt::format("regular expression takes too long: /{}/", textOf(pattern.get()));
        *exception = engine().JSValueMakeString(context, scriptString(reason).get());
    }
    return engine().JSValueMakeUndefined(context);
}

JSValueRef ScriptContext::Implementation::isMatchingXPath(JSContextRef context, JSObjectRef /*function*/,
                                                          JSObjectRef /*self*/, size_t count,
                                                          const JSValueRef values[], JSValueRef* exception) {
    const std::string expression = argument(context, count, values, 0, exception);
    return engine().JSValueMakeBoolean(context, running().document->isMatchingXPath(expression));
}

JSValueRef ScriptContext::Implementation::jsonStringForXPath(JSContextRef context, JSObjectRef /*function*/,
                                                             JSObjectRef /*self*/, size_t count,
                                                             const JSValueRef values[],
                                                             JSValueRef* exception) {
    const std::string expression = argument(context, count, values, 0, exception);
    return valueOf(context, running().document->JSONStringForXPath(expression));
}

JSValueRef ScriptContext::Implementation::jsonString(JSContextRef context, JSObjectRef /*function*/,
                                                     JSObjectRef /*self*/, size_t /*count*/,
                                                     const JSValueRef /*values*/[],
                                                     JSValueRef* /*exception*/) {
    return valueOf(context, running().document->JSONString());
}

ScriptContext::ScriptContext(std::unique_ptr<Implementation> implementation)
    : implementation_(std::move(implementation)) {}
ScriptContext::~ScriptContext() = default;

std::shared_ptr<ScriptContext> ScriptContext::make(const ScriptLimits& limits, Error* error) {
    if (!ScriptEngine::load(error)) return nullptr;
    auto implementation = std::make_unique<Implementation>(limits);
    implementation->defineLog();
    return std::shared_ptr<ScriptContext>(new ScriptContext(std::move(implementation)));
}

void ScriptContext::exposeDocument(const QVCTXMLDocument& document) {
    Implementation& self = *implementation_;
    self.document = &document;
    setProperty(self.context, self.global(), "document",
                engine().JSObjectMake(self.context, Implementation::documentClass(), nullptr));
}

void ScriptContext::evaluate(std::string_view script) {
    Implementation& self = *implementation_;
    const Prepared& program = prepared(script);
    self.run([&] {
        if (!program.isOwn) self.guard();
        if (self.stop != Implementation::Stop::none) return;
        JSValueRef exception = nullptr;
        engine().JSEvaluateScript(self.context, program.text.get(), nullptr, nullptr, 1, &exception);
        if (exception != nullptr) self.logException(exception, script);
    });
}

std::optional<PropertyList::Array> ScriptContext::callForArray(std::string_view function) {
    Implementation& self = *implementation_;
    std::optional<PropertyList::Array> result;
    self.run([&] {
        JSValueRef exception = nullptr;
        const JSValueRef callee = property(self.context, self.global(), function, &exception);
        if (exception == nullptr &&
            (!engine().JSValueIsObject(self.context, callee) ||
             !engine().JSObjectIsFunction(self.context, const_cast<JSObjectRef>(callee)))) {
            return Implementation::logProblem(fmt::format("TypeError: {} is not a function", function));
        }
        const JSValueRef value = exception != nullptr ? nullptr
                                                      : engine().JSObjectCallAsFunction(
                                                            self.context, const_cast<JSObjectRef>(callee),
                                                            nullptr, 0, nullptr, &exception);
        if (value == nullptr || exception != nullptr) return self.logException(exception);
        if (engine().JSValueIsUndefined(self.context, value) || engine().JSValueIsNull(self.context, value))
            return;
        std::string problem;
        result = arrayOf(self.context, value, problem);
        if (!result && self.stop == Implementation::Stop::none) Implementation::logProblem(problem);
    });
    return isStopped() ? std::nullopt : std::move(result);
}

bool ScriptContext::isStopped() const {
    return implementation_->stop != Implementation::Stop::none;
}

bool ScriptContext::checkSyntax(std::string_view script, Error* error) {
    const auto context = make({}, error);
    if (!context) return false;
    const JSGlobalContextRef reference = context->implementation_->context;
    JSValueRef exception = nullptr;
    if (engine().JSCheckScriptSyntax(reference, prepared(script).text.get(), nullptr, 1, &exception))
        return true;
    const double line = engine().JSValueToNumber(
        reference,
        property(reference, engine().JSValueToObject(reference, exception, nullptr), "line", nullptr),
        nullptr);
    ErrorPlace place{.part = "script"};
    if (line >= 1) place.line = static_cast<std::uint64_t>(line);
    return fail(error, kErrorMalformed, withReason(textOf(reference, exception, nullptr), script),
                std::move(place));
}

}  // namespace qvct
