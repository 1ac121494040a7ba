#pragma once

#include "platform/base/Error.h"
#include "platform/data/PropertyList.h"

#include <chrono>
#include <cstddef>
#include <memory>
#include <optional>
#include <string_view>

namespace qvct {

class QVCTXMLDocument;

/// What a script may use up. Time is that of the whole evaluation; memory is what the script's objects take.
/// Both are checked about every ten milliseconds, so that a single operation can exceed them. Processes that
/// allow it (`HardLimit`) are ended when a script cannot be stopped otherwise.
struct ScriptLimits {
    std::chrono::milliseconds time{1000};
    std::size_t memory = std::size_t{64} << 20;
};

/// Bounds on what a script returns: values in all, their nesting, bytes of text in all.
inline constexpr std::size_t kMostScriptValues = 2000;
inline constexpr int kDeepestScriptValue = 16;
inline constexpr std::size_t kMostScriptText = std::size_t{1} << 20;
/// Most lines that one evaluation writes to the log; those behind are dropped.
inline constexpr int kMostScriptMessages = 100;
/// Most bytes of a line about a script; the rest is cut off.
inline constexpr std::size_t kLongestScriptMessage = 4096;

/// A fresh global object in which one rule's script runs, with its limits.
///
/// Contexts of one thread share a virtual machine, which makes them cheap, but nothing that scripts can see.
/// Faults are logged as "JavaScript Exception: ..."; a context can be used after a fault, but does nothing
/// any more once a limit was reached. Use a context from the thread that made it, and one at a time.
/// @cost  About a tenth of a millisecond for making one.
class ScriptContext {
  public:
    /// With `console.log` and `__log` ("JavaScript: ..." in the log). The limits count from here. Null, and
    /// an error, where there is no script engine.
    static std::shared_ptr<ScriptContext> make(const ScriptLimits& limits, Error* error = nullptr);
    ScriptContext(const ScriptContext&) = delete;
    ScriptContext& operator=(const ScriptContext&) = delete;
    ~ScriptContext();

    /// Makes the document's three operations callable as the global `document`. It must outlive the context.
    void exposeDocument(const QVCTXMLDocument& document);

    /// Runs a program.
    void evaluate(std::string_view script);

    /// Calls the global function without arguments and converts the array that it returns: objects become
    /// dictionaries; null, undefined and symbols are left out. Nothing when there is no such function, it
    /// failed, or it returned nothing, no array or too much.
    std::optional<PropertyList::Array> callForArray(std::string_view function);

    /// Whether a limit was reached.
    bool isStopped() const;

    /// Whether the text is a valid program; else false, and an error that says where it is not.
    static bool checkSyntax(std::string_view script, Error* error = nullptr);

  private:
    struct Implementation;
    explicit ScriptContext(std::unique_ptr<Implementation> implementation);

    std::unique_ptr<Implementation> implementation_;
};

}  // namespace qvct
