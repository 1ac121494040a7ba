#pragma once

#include "autotagging/scripts/ScriptEngine.h"
#include "platform/data/PropertyList.h"

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <type_traits>

/// Conversion of values to and from scripts. Includes the engine's header: for the .cpp files of this folder
/// only.
namespace qvct {

struct ScriptStringReleaser {
    void operator()(JSStringRef string) const { engine().JSStringRelease(string); }
};
using ScriptString = std::unique_ptr<std::remove_pointer_t<JSStringRef>, ScriptStringReleaser>;

/// UTF-8 to a script's string and back; malformed parts become U+FFFD.
ScriptString scriptString(std::string_view text);
std::string textOf(JSStringRef string);
/// The value as a script's `String(value)` gives it; empty and `exception` set where that fails.
std::string textOf(JSContextRef context, JSValueRef value, JSValueRef* exception);

void setProperty(JSContextRef context, JSObjectRef object, std::string_view name, JSValueRef value);
JSValueRef propertyOf(JSContextRef context, JSObjectRef object, std::string_view name, JSValueRef* exception);

/// Converts an array that a script returned. Nothing when the value is no array or too large, or when a
/// getter throws; `problem` is then the reason, unless the script is being stopped.
std::optional<PropertyList::Array> arrayOf(JSContextRef context, JSValueRef value, std::string& problem);

}  // namespace qvct
