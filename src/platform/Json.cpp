#include "platform/Json.h"

#include "platform/Text.h"

#include <cmath>

#include <rapidjson/prettywriter.h>
#include <rapidjson/stringbuffer.h>
#include <rapidjson/writer.h>

namespace qvct {
namespace {

template <typename Writer>
void writeText(Writer& writer, const std::string& text) {
    if (isValidUtf8(text)) {
        writer.String(text.data(), static_cast<rapidjson::SizeType>(text.size()));
    } else {
        const std::string repaired = utf8FromUtf16(utf16FromUtf8(text));
        writer.String(repaired.data(), static_cast<rapidjson::SizeType>(repaired.size()));
    }
}

template <typename Writer>
void write(Writer& writer, const PropertyList& value);

template <typename Writer>
void writeScalar(Writer& writer, const PropertyList& value) {
    if (const bool* flag = value.boolean()) {
        writer.Bool(*flag);
    } else if (const std::int64_t* number = value.signedInteger()) {
        writer.Int64(*number);
    } else if (const std::uint64_t* large = value.unsignedInteger()) {
        writer.Uint64(*large);
    } else if (const double* real = value.real(); real != nullptr && std::isfinite(*real)) {
        writer.Double(*real);
    } else {
        writer.Null();
    }
}

template <typename Writer>
void write(Writer& writer, const PropertyList& value) {
    if (const std::string* text = value.string()) {
        writeText(writer, *text);
    } else if (const PropertyList::Array* array = value.array()) {
        writer.StartArray();
        for (const PropertyList& element : *array) write(writer, element);
        writer.EndArray();
    } else if (const PropertyList::Dictionary* dictionary = value.dictionary()) {
        writer.StartObject();
        for (const PropertyList::Entry& entry : *dictionary) {
            writeText(writer, entry.key);
            write(writer, entry.value);
        }
        writer.EndObject();
    } else {
        writeScalar(writer, value);
    }
}

template <typename Writer>
std::string textOf(const PropertyList& value) {
    rapidjson::StringBuffer buffer;
    Writer writer(buffer);
    write(writer, value);
    return {buffer.GetString(), buffer.GetSize()};
}

}  // namespace

std::string jsonText(const PropertyList& value, JsonStyle style) {
    using Buffer = rapidjson::StringBuffer;
    return style == JsonStyle::pretty ? textOf<rapidjson::PrettyWriter<Buffer>>(value)
                                      : textOf<rapidjson::Writer<Buffer>>(value);
}

}  // namespace qvct
