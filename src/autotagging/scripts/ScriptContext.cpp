#include "autotagging/scripts/ScriptContext.h"

#include "autotagging/scripts/ScriptFunctions.h"
#include "autotagging/scripts/ScriptGuard.h"
#include "autotagging/scripts/ScriptValues.h"
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
    ScriptHost host{Clock::now() + limits.time};
    Stop stop = Stop::none;
    std::shared_ptr<ContextGroup> group = sharedGroup();
    JSGlobalContextRef context = engine().JSGlobalContextCreateInGroup(group->reference(), nullptr);
    bool isGuarded = false;
    std::optional<HardLimit> hardLimit;  ///< For foreign scripts, until the context has gone.

    explicit Implementation(const ScriptLimits& chosen) : limits(chosen) {
        engine().JSContextGroupSetExecutionTimeLimit(group->reference(), kSlice, shouldTerminate, this);
    }
    Implementation(const Implementation&) = delete;
    Implementation& operator=(const Implementation&) = delete;

    ~Implementation() {
        engine().JSContextGroupClearExecutionTimeLimit(group->reference());
        engine().JSGlobalContextRelease(context);
        // A virtual machine that was stopped may hold much memory, so the thread's next context gets a new
        // one.
        if (stop != Stop::none && groupOfThisThread() == group) groupOfThisThread().reset();
    }

    JSObjectRef global() const { return engine().JSContextGetGlobalObject(context); }

    void logException(JSValueRef thrown, std::string_view script = {}) {
        if (stop == Stop::none && thrown != nullptr)
            logProblem(withReason(textOf(context, thrown, nullptr), script));
        if (stop != Stop::none) logStop();
    }

    static void logProblem(std::string_view text) {
        log(fmt::format("JavaScript Exception: {}", text.substr(0, kLongestScriptMessage)));
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
        if (Clock::now() >= host.deadline) {
            stop = Stop::time;
        } else {
            const XPathDeadline ofExpressions(host.deadline);
            work();
        }
        if (stop != Stop::none) logStop();
    }

    /// Called by the machine at the end of each slice. It has to request the next slice itself, even when it
    /// says stop: calls into the machine from our own functions may swallow the stop.
    static bool shouldTerminate(JSContextRef context, void* self) {
        auto& implementation = *static_cast<Implementation*>(self);
        if (Clock::now() >= implementation.host.deadline) {
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
        return engine().JSValueToNumber(context, propertyOf(context, statistics, "heapCapacity", nullptr),
                                        nullptr);
    }

    void guard();

    bool isStopLogged = false;
};

/// Puts what foreign scripts can reach under the guard. The library's own scripts run without it.
void ScriptContext::Implementation::guard() {
    if (std::exchange(isGuarded, true)) return;
    hardLimit.emplace(limits.time + kHardTime, limits.memory + kHardMemory,
                      LogScope::prefix() + "JavaScript");
    thread_local const ScriptString program = scriptString(scriptGuard());
    engine().JSGlobalContextSetEvalEnabled(context, false, scriptString("not available to rules").get());
    const JSValueRef function =
        engine().JSEvaluateScript(context, program.get(), nullptr, nullptr, 1, nullptr);
    const JSValueRef check = expressionCheck(context);
    JSValueRef exception = nullptr;
    const JSObjectRef callee =
        function != nullptr ? engine().JSValueToObject(context, function, nullptr) : nullptr;
    if (callee != nullptr) engine().JSObjectCallAsFunction(context, callee, nullptr, 1, &check, &exception);
    if (callee != nullptr && exception == nullptr) return;
    logProblem("the guard of scripts does not run");
    stop = Stop::unguarded;
}

ScriptContext::ScriptContext(std::unique_ptr<Implementation> implementation)
    : implementation_(std::move(implementation)) {}
ScriptContext::~ScriptContext() = default;

std::shared_ptr<ScriptContext> ScriptContext::make(const ScriptLimits& limits, Error* error) {
    if (!ScriptEngine::load(error)) return nullptr;
    auto implementation = std::make_unique<Implementation>(limits);
    defineLog(implementation->context);
    return std::shared_ptr<ScriptContext>(new ScriptContext(std::move(implementation)));
}

void ScriptContext::exposeDocument(const QVCTXMLDocument& document) {
    Implementation& self = *implementation_;
    self.host.document = &document;
    setProperty(self.context, self.global(), "document", documentObject(self.context));
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
        const JSValueRef callee = propertyOf(self.context, self.global(), function, &exception);
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
        propertyOf(reference, engine().JSValueToObject(reference, exception, nullptr), "line", nullptr),
        nullptr);
    ErrorPlace place{.part = "script"};
    if (line >= 1) place.line = static_cast<std::uint64_t>(line);
    return fail(error, kErrorMalformed, withReason(textOf(reference, exception, nullptr), script),
                std::move(place));
}

}  // namespace qvct
