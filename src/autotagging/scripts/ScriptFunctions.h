#pragma once

#include "autotagging/scripts/ScriptEngine.h"

#include <chrono>

/// What scripts can call. Includes the engine's header: for the .cpp files of this folder only.
namespace qvct {

class QVCTXMLDocument;

/// What the functions work with when a context's script calls them. Of those in a thread the latest is the
/// running one. Kept here and not in the global object, since the engine looks up the variables of a global
/// object with private data slowly.
struct ScriptHost {
    std::chrono::steady_clock::time_point deadline;
    const QVCTXMLDocument* document = nullptr;
    int messages = 0;

    explicit ScriptHost(std::chrono::steady_clock::time_point end);
    ScriptHost(const ScriptHost&) = delete;
    ScriptHost& operator=(const ScriptHost&) = delete;
    ~ScriptHost();

  private:
    ScriptHost* outer_;
};

/// Makes `console.log` and its like, and `__log`.
void defineLog(JSContextRef context);

/// The object that scripts know as `document`, with its three operations.
JSObjectRef documentObject(JSContextRef context);

/// The function that the guard calls with an expression, its flags, a text and where matching begins. It
/// throws where that would take too long.
JSObjectRef expressionCheck(JSContextRef context);

}  // namespace qvct
