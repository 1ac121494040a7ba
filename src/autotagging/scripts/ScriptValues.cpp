#include "autotagging/scripts/ScriptValues.h"

#include "autotagging/scripts/ScriptContext.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <limits>

#include <fmt/format.h>

namespace qvct {
namespace {

/// Seconds between 1970 and 2001, where property lists begin to count.
constexpr double kReferenceDate = 978307200;

/// Converts values and counts down what is left of the bounds. The first failure ends the conversion.
class Converter {
  public:
    Converter(JSContextRef context, std::string& problem) : context_(context), problem_(problem) {}

    std::optional<PropertyList::Array> array(JSObjectRef object, int depth) {
        const double length =
            engine().JSValueToNumber(context_, property(object, lengthName_.get()), &exception_);
        if (failed() || !enters(depth) || !takes(length)) return std::nullopt;
        PropertyList::Array elements;
        for (unsigned i = 0; i < static_cast<unsigned>(length); ++i) {
            const JSValueRef element = engine().JSObjectGetPropertyAtIndex(context_, object, i, &exception_);
            std::optional<PropertyList> converted = failed() ? std::nullopt : value(element, depth + 1);
            if (hasFailed_) return std::nullopt;
            if (converted) elements.push_back(std::move(*converted));
        }
        return elements;
    }

  private:
    /// Nothing for what a property list has no form for, or after a failure.
    std::optional<PropertyList> value(JSValueRef value, int depth) {
        switch (engine().JSValueGetType(context_, value)) {
            case kJSTypeBoolean:
                return PropertyList(engine().JSValueToBoolean(context_, value));
            case kJSTypeNumber:
                return PropertyList(engine().JSValueToNumber(context_, value, nullptr));
            case kJSTypeString:
                return text(value);
            case kJSTypeObject:
                return object(value, depth);
            default:
                return std::nullopt;
        }
    }

    std::optional<PropertyList> text(JSValueRef value) {
        const ScriptString string(engine().JSValueToStringCopy(context_, value, &exception_));
        if (failed() || !string) return std::nullopt;
        return takesText(engine().JSStringGetLength(string.get()))
                   ? std::optional(PropertyList(textOf(string.get())))
                   : std::nullopt;
    }

    std::optional<PropertyList> object(JSValueRef value, int depth) {
        const JSObjectRef object = engine().JSValueToObject(context_, value, &exception_);
        if (failed()) return std::nullopt;
        if (engine().JSValueIsDate(context_, value)) {
            const double milliseconds = engine().JSValueToNumber(context_, value, &exception_);
            if (failed()) return std::nullopt;
            return PropertyList(PropertyList::Date{milliseconds / 1000 - kReferenceDate});
        }
        if (engine().JSValueIsArray(context_, value)) {
            auto elements = array(object, depth);
            return elements ? std::optional(PropertyList(std::move(*elements))) : std::nullopt;
        }
        auto members = dictionary(object, depth);
        return members ? std::optional(PropertyList(std::move(*members))) : std::nullopt;
    }

    std::optional<PropertyList::Dictionary> dictionary(JSObjectRef object, int depth) {
        const std::unique_ptr<std::remove_pointer_t<JSPropertyNameArrayRef>,
                              decltype(&JSPropertyNameArrayRelease)>
            names(engine().JSObjectCopyPropertyNames(context_, object), engine().JSPropertyNameArrayRelease);
        const std::size_t count = engine().JSPropertyNameArrayGetCount(names.get());
        if (!enters(depth) || !takes(static_cast<double>(count))) return std::nullopt;
        PropertyList::Dictionary members;
        for (std::size_t i = 0; i < count; ++i) {
            const JSStringRef name = engine().JSPropertyNameArrayGetNameAtIndex(names.get(), i);
            const JSValueRef member = property(object, name);
            if (failed() || !takesText(engine().JSStringGetLength(name))) return std::nullopt;
            std::optional<PropertyList> converted = value(member, depth + 1);
            if (hasFailed_) return std::nullopt;
            if (converted) members.set(textOf(name), std::move(*converted));
        }
        return members;
    }

    JSValueRef property(JSObjectRef object, JSStringRef name) {
        return engine().JSObjectGetProperty(context_, object, name, &exception_);
    }

    bool fail(std::string problem) {
        hasFailed_ = true;
        problem_ = std::move(problem);
        return false;
    }

    /// Whether the script has thrown something meanwhile.
    bool failed() {
        if (exception_ == nullptr) return hasFailed_;
        const JSValueRef thrown = std::exchange(exception_, nullptr);
        fail(textOf(context_, thrown, nullptr));
        return true;
    }

    bool enters(int depth) {
        return depth < kDeepestScriptValue || fail("RangeError: the result is nested too deep");
    }

    bool takes(double values) {
        if (!(values <= static_cast<double>(valuesLeft_)))
            return fail("RangeError: the result has too many values");
        valuesLeft_ -= static_cast<std::size_t>(values);
        return true;
    }

    bool takesText(std::size_t length) {
        if (length > textLeft_) return fail("RangeError: the result has too much text");
        textLeft_ -= length;
        return true;
    }

    JSContextRef context_;
    std::string& problem_;
    const ScriptString lengthName_ = scriptString("length");
    JSValueRef exception_ = nullptr;
    bool hasFailed_ = false;
    std::size_t valuesLeft_ = kMostScriptValues;
    std::size_t textLeft_ = kMostScriptText;
};

std::string_view nameOf(JSType type) {
    switch (type) {
        case kJSTypeBoolean:
            return "a boolean";
        case kJSTypeNumber:
            return "a number";
        case kJSTypeString:
            return "a string";
        case kJSTypeObject:
            return "an object";
        default:
            return "a symbol";
    }
}

}  // namespace

ScriptString scriptString(std::string_view text) {
    const auto isPlain = [](char c) { return c > 0; };
    if (std::all_of(text.begin(), text.end(), isPlain)) {  // the engine works faster on narrow strings
        return ScriptString(engine().JSStringCreateWithUTF8CString(std::string(text).c_str()));
    }
    const std::u16string wide = utf16FromUtf8(text);
    return ScriptString(
        engine().JSStringCreateWithCharacters(reinterpret_cast<const JSChar*>(wide.data()), wide.size()));
}

std::string textOf(JSStringRef string) {
    return utf8FromUtf16({reinterpret_cast<const char16_t*>(engine().JSStringGetCharactersPtr(string)),
                          engine().JSStringGetLength(string)});
}

std::string textOf(JSContextRef context, JSValueRef value, JSValueRef* exception) {
    const ScriptString string(engine().JSValueToStringCopy(context, value, exception));
    return string ? textOf(string.get()) : std::string{};
}

void setProperty(JSContextRef context, JSObjectRef object, std::string_view name, JSValueRef value) {
    engine().JSObjectSetProperty(context, object, scriptString(name).get(), value, kJSPropertyAttributeNone,
                                 nullptr);
}

JSValueRef propertyOf(JSContextRef context, JSObjectRef object, std::string_view name,
                      JSValueRef* exception) {
    return engine().JSObjectGetProperty(context, object, scriptString(name).get(), exception);
}

std::optional<PropertyList::Array> arrayOf(JSContextRef context, JSValueRef value, std::string& problem) {
    if (!engine().JSValueIsArray(context, value)) {
        problem = fmt::format("TypeError: not an array of tags but {}",
                              nameOf(engine().JSValueGetType(context, value)));
        return std::nullopt;
    }
    return Converter(context, problem).array(engine().JSValueToObject(context, value, nullptr), 0);
}

}  // namespace qvct
