#include "platform/data/Json.h"

#include "platform/text/Text.h"

#include <algorithm>
#include <cmath>
#include <string_view>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

class JsonWriter {
  public:
    explicit JsonWriter(JsonStyle style) : isPretty_(style == JsonStyle::pretty) {}

    void write(const PropertyList& value) {
        if (const std::string* text = value.string()) {
            writeText(*text);
        } else if (const PropertyList::Dictionary* dictionary = value.dictionary()) {
            writeAll(*dictionary, '{', '}', [this](const PropertyList::Entry& entry) {
                writeText(entry.key);
                out_ += isPretty_ ? ": " : ":";
                write(entry.value);
            });
        } else if (const PropertyList::Array* array = value.array()) {
            writeAll(*array, '[', ']', [this](const PropertyList& element) { write(element); });
        } else {
            writeScalar(value);
        }
    }

    std::string take() { return std::move(out_); }

  private:
    template <typename Members, typename WriteMember>
    void writeAll(const Members& members, char open, char close, WriteMember writeMember) {
        out_ += open;
        ++depth_;
        bool isFirst = true;
        for (const auto& member : members) {
            if (!std::exchange(isFirst, false)) out_ += ',';
            breakLine();
            writeMember(member);
        }
        --depth_;
        if (!isFirst) breakLine();
        out_ += close;
    }

    void breakLine() {
        constexpr std::size_t kIndentation = 4;
        if (!isPretty_) return;
        out_ += '\n';
        out_.append(depth_ * kIndentation, ' ');
    }

    void writeScalar(const PropertyList& value) {
        if (const bool* flag = value.boolean()) {
            out_ += *flag ? "true" : "false";
        } else if (const std::int64_t* number = value.signedInteger()) {
            out_ += fmt::to_string(*number);
        } else if (const std::uint64_t* large = value.unsignedInteger()) {
            out_ += fmt::to_string(*large);
        } else if (const double* real = value.real(); real != nullptr && std::isfinite(*real)) {
            out_ += fmt::to_string(*real);
        } else {
            out_ += "null";
        }
    }

    void writeText(std::string_view text) {
        const auto isAscii = [](char c) { return static_cast<unsigned char>(c) < 0x80; };
        out_ += '"';
        if (std::all_of(text.begin(), text.end(), isAscii) || isValidUtf8(text)) {
            writeEscaped(text);
        } else {
            writeEscaped(utf8FromUtf16(utf16FromUtf8(text)));
        }
        out_ += '"';
    }

    void writeEscaped(std::string_view text) {
        for (const char c : text) {
            const auto byte = static_cast<unsigned char>(c);
            if (byte >= 0x20 && c != '"' && c != '\\') {
                out_ += c;
            } else if (c == '"' || c == '\\') {
                out_ += {'\\', c};
            } else if (c == '\n') {
                out_ += "\\n";
            } else if (c == '\t') {
                out_ += "\\t";
            } else {
                out_ += fmt::format("\\u{:04x}", byte);
            }
        }
    }

    bool isPretty_;
    std::size_t depth_ = 0;
    std::string out_;
};

}  // namespace

std::string jsonText(const PropertyList& value, JsonStyle style) {
    JsonWriter writer(style);
    writer.write(value);
    return writer.take();
}

}  // namespace qvct
