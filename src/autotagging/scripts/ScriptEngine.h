#pragma once

#include "platform/base/Error.h"

#include <JavaScriptCore/JavaScript.h>

// Exported by the engine, but not declared in its headers.
extern "C" {
using JSShouldTerminateCallback = bool (*)(JSContextRef, void*);
void JSContextGroupSetExecutionTimeLimit(JSContextGroupRef, double seconds, JSShouldTerminateCallback, void*);
void JSContextGroupClearExecutionTimeLimit(JSContextGroupRef);
void JSGlobalContextSetEvalEnabled(JSGlobalContextRef, bool isEnabled, JSStringRef message);
JSObjectRef JSGetMemoryUsageStatistics(JSContextRef);
}

#define QVCT_SCRIPT_ENGINE_FUNCTIONS(X)      \
    X(JSCheckScriptSyntax)                   \
    X(JSClassCreate)                         \
    X(JSContextGetGlobalObject)              \
    X(JSContextGroupClearExecutionTimeLimit) \
    X(JSContextGroupCreate)                  \
    X(JSContextGroupRelease)                 \
    X(JSContextGroupSetExecutionTimeLimit)   \
    X(JSEvaluateScript)                      \
    X(JSGetMemoryUsageStatistics)            \
    X(JSGlobalContextCreateInGroup)          \
    X(JSGlobalContextRelease)                \
    X(JSGlobalContextSetEvalEnabled)         \
    X(JSObjectCallAsFunction)                \
    X(JSObjectCopyPropertyNames)             \
    X(JSObjectGetProperty)                   \
    X(JSObjectGetPropertyAtIndex)            \
    X(JSObjectIsFunction)                    \
    X(JSObjectMake)                          \
    X(JSObjectMakeFunctionWithCallback)      \
    X(JSObjectSetProperty)                   \
    X(JSPropertyNameArrayGetCount)           \
    X(JSPropertyNameArrayGetNameAtIndex)     \
    X(JSPropertyNameArrayRelease)            \
    X(JSStringCreateWithCharacters)          \
    X(JSStringCreateWithUTF8CString)         \
    X(JSStringGetCharactersPtr)              \
    X(JSStringGetLength)                     \
    X(JSStringRelease)                       \
    X(JSValueGetType)                        \
    X(JSValueIsArray)                        \
    X(JSValueIsDate)                         \
    X(JSValueIsNull)                         \
    X(JSValueIsObject)                       \
    X(JSValueIsUndefined)                    \
    X(JSValueMakeBoolean)                    \
    X(JSValueMakeNull)                       \
    X(JSValueMakeString)                     \
    X(JSValueMakeUndefined)                  \
    X(JSValueToBoolean)                      \
    X(JSValueToNumber)                       \
    X(JSValueToObject)                       \
    X(JSValueToStringCopy)

namespace qvct {

/// The functions of the script engine. Its library is loaded when the first script runs, since most runs need
/// no script and loading doubles what a start takes: 8 to 9 ms of processor time instead of 4.
///
/// For the .cpp files of scripts only. Safe from every thread.
struct ScriptEngine {
#define QVCT_SCRIPT_ENGINE_MEMBER(name) \
    decltype(&::name) name = nullptr;  // NOLINT(bugprone-macro-parentheses): a name
    QVCT_SCRIPT_ENGINE_FUNCTIONS(QVCT_SCRIPT_ENGINE_MEMBER)
#undef QVCT_SCRIPT_ENGINE_MEMBER

    /// Whether the engine is there; else an error that names what is missing.
    static bool load(Error* error = nullptr);
};

/// To be called after a successful `load`.
const ScriptEngine& engine();

}  // namespace qvct
