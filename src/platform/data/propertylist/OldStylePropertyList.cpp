#include "platform/data/propertylist/OldStylePropertyList.h"

#include "platform/data/PropertyListFile.h"
#include "platform/data/propertylist/PropertyListBuilder.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <array>
#include <string>
#include <utility>

namespace qvct {
namespace {

/// Octal escapes above 0177 are characters in the native encoding of the system that this form comes from.
constexpr std::array<char16_t, 128> kUpperHalf = {
    0x00A0, 0x00C0, 0x00C1, 0x00C2, 0x00C3, 0x00C4, 0x00C5, 0x00C7, 0x00C8, 0x00C9, 0x00CA, 0x00CB, 0x00CC,
    0x00CD, 0x00CE, 0x00CF, 0x00D0, 0x00D1, 0x00D2, 0x00D3, 0x00D4, 0x00D5, 0x00D6, 0x00D9, 0x00DA, 0x00DB,
    0x00DC, 0x00DD, 0x00DE, 0x00B5, 0x00D7, 0x00F7, 0x00A9, 0x00A1, 0x00A2, 0x00A3, 0x2044, 0x00A5, 0x0192,
    0x00A7, 0x00A4, 0x2019, 0x201C, 0x00AB, 0x2039, 0x203A, 0xFB01, 0xFB02, 0x00AE, 0x2013, 0x2020, 0x2021,
    0x00B7, 0x00A6, 0x00B6, 0x2022, 0x201A, 0x201E, 0x201D, 0x00BB, 0x2026, 0x2030, 0x00AC, 0x00BF, 0x00B9,
    0x02CB, 0x00B4, 0x02C6, 0x02DC, 0x00AF, 0x02D8, 0x02D9, 0x00A8, 0x00B2, 0x02DA, 0x00B8, 0x00B3, 0x02DD,
    0x02DB, 0x02C7, 0x2014, 0x00B1, 0x00BC, 0x00BD, 0x00BE, 0x00E0, 0x00E1, 0x00E2, 0x00E3, 0x00E4, 0x00E5,
    0x00E7, 0x00E8, 0x00E9, 0x00EA, 0x00EB, 0x00EC, 0x00C6, 0x00ED, 0x00AA, 0x00EE, 0x00EF, 0x00F0, 0x00F1,
    0x0141, 0x00D8, 0x0152, 0x00BA, 0x00F2, 0x00F3, 0x00F4, 0x00F5, 0x00F6, 0x00E6, 0x00F9, 0x00FA, 0x00FB,
    0x0131, 0x00FC, 0x00FD, 0x0142, 0x00F8, 0x0153, 0x00DF, 0x00FE, 0x00FF, 0xFFFD, 0xFFFD};

bool isBare(char c) {
    return isAsciiWordCharacter(c) || std::string_view("$/:.-").find(c) != std::string_view::npos;
}

int digitOf(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    return 16;
}

class Reader {
  public:
    Reader(std::string_view text, PropertyListFault& fault, PropertyListPlace* wanted)
        : text_(text), fault_(fault), wanted_(wanted) {}

    std::optional<PropertyList> read() {
        if (!skipBlanks()) return std::nullopt;
        if (std::string_view("{(<\"'").find(next()) == std::string_view::npos) {
            refuse("neither a dictionary, an array, data nor a quoted text");
            return std::nullopt;
        }
        if (!readValue()) return std::nullopt;
        while (builder_.depth() > 0) {
            if (!(builder_.isInDictionary() ? readEntry() : readItem())) return std::nullopt;
        }
        if (!skipBlanks()) return std::nullopt;
        if (at_ == text_.size()) return builder_.take();
        refuse("something behind the property list");
        return std::nullopt;
    }

  private:
    bool refuse(std::string_view reason, ErrorCode code = kErrorMalformed) {
        fault_ = {code, at_, std::string(reason)};
        return false;
    }

    /// Keeps the offset, if the value that comes next is the one that is looked for.
    void note(std::size_t offset) {
        if (wanted_ != nullptr && builder_.isNext(wanted_->path)) wanted_->offset = offset;
    }

    /// The character ahead; 0 at the end.
    char next(std::size_t further = 0) const {
        return at_ + further < text_.size() ? text_[at_ + further] : '\0';
    }

    bool take(char c) {
        const bool isThere = next() == c && at_ < text_.size();
        at_ += isThere ? 1 : 0;
        return isThere;
    }

    /// Passes over blanks and comments. False for a comment that does not end.
    bool skipBlanks() {
        while (at_ < text_.size()) {
            if (std::string_view(" \t\n\v\f\r").find(next()) != std::string_view::npos) {
                ++at_;
            } else if (next() == '/' && next(1) == '/') {
                at_ = std::min(text_.find_first_of("\n\r", at_), text_.size());
            } else if (next() == '/' && next(1) == '*') {
                const std::size_t end = text_.find("*/", at_ + 2);
                if (end == std::string_view::npos) return refuse("a comment that does not end");
                at_ = end + 2;
            } else {
                break;
            }
        }
        return true;
    }

    /// A value, or the opening of a container.
    bool readValue() {
        if (!count()) return false;
        if (next() == '{' || next() == '(') return openContainer();
        if (next() == '<') return readData();
        std::string word;
        if (!readWord(word)) return false;
        builder_.add(std::move(word));
        return true;
    }

    bool count() {
        return ++values_ <= mostPropertyListValues(text_.size()) ||
               refuse("too many keys and values", kErrorTooLarge);
    }

    bool openContainer() {
        if (builder_.depth() >= static_cast<std::size_t>(kDeepestPropertyList))
            return refuse("nested too deeply", kErrorTooLarge);
        if (take('{')) {
            builder_.openDictionary();
        } else {
            ++at_;
            builder_.openArray();
        }
        isFirst_ = true;
        return true;
    }

    /// What stands in a dictionary up to the next value, or its end.
    bool readEntry() {
        if (!skipBlanks()) return false;
        if (!isFirst_ && !take(';') && next() != '}') return refuse("no \";\" behind a value");
        isFirst_ = false;
        if (!skipBlanks()) return false;
        if (take('}')) return close();
        std::string key;
        const std::size_t start = at_;
        if (!readWord(key) || !skipBlanks()) return false;
        if (!count()) return false;
        builder_.key(key);
        note(start);
        if (next() == ';') {  // a key alone stands for itself
            builder_.add(std::move(key));
            return count();
        }
        if (!take('=')) return refuse("no \"=\" behind a key");
        return skipBlanks() && readValue();
    }

    /// The same in an array.
    bool readItem() {
        if (!skipBlanks()) return false;
        if (!isFirst_ && !take(',') && next() != ')') return refuse("no \",\" behind a value");
        isFirst_ = false;
        if (!skipBlanks()) return false;
        if (take(')')) return close();
        note(at_);
        return readValue();
    }

    bool close() {
        builder_.close();
        isFirst_ = false;
        return true;
    }

    bool readData() {
        PropertyList::Data bytes;
        ++at_;
        while (true) {
            if (!skipBlanks()) return false;
            if (take('>')) break;
            const int high = digitOf(next());
            const int low = digitOf(next(1));
            if (high > 15 || low > 15) return refuse("data that is not pairs of hexadecimal digits");
            bytes.push_back(static_cast<std::uint8_t>(high * 16 + low));
            at_ += 2;
        }
        builder_.add(std::move(bytes));
        return true;
    }

    bool readWord(std::string& word) {
        const char quote = next();
        if (quote == '"' || quote == '\'') return readQuoted(quote, word);
        const std::size_t start = at_;
        while (at_ < text_.size() && isBare(next())) ++at_;
        word = text_.substr(start, at_ - start);
        if (!word.empty()) return true;
        return refuse(at_ == text_.size() ? "it ends too early" : "an unexpected character");
    }

    bool readQuoted(char quote, std::string& word) {
        const std::size_t start = at_++;
        while (at_ < text_.size() && next() != quote) {
            if (next() == '\\') {
                if (!readEscape(word)) return false;
            } else {
                word += text_[at_++];
            }
        }
        if (!take(quote)) {
            at_ = start;
            return refuse("a text that does not end");
        }
        if (isValidUtf8(word) && word.find('\0') == std::string::npos) return true;
        at_ = start;
        return refuse("a text that is not valid Unicode, or holds a NUL character");
    }

    bool readEscape(std::string& word) {
        ++at_;
        if (next() == 'U') return readUnicode(word);
        if (digitOf(next()) < 8) {
            const unsigned code = number(3, 8) & 0xFFU;
            appendUnits(
                word, std::u16string(1, code < 0x80 ? static_cast<char16_t>(code) : kUpperHalf[code - 0x80]));
            return true;
        }
        constexpr std::string_view names = "abfnrtv";
        constexpr std::string_view characters = "\a\b\f\n\r\t\v";
        const std::size_t place = names.find(next());
        if (at_ < text_.size()) word += place == std::string_view::npos ? next() : characters[place];
        ++at_;
        return true;
    }

    /// "\U" and a unit of UTF-16 in hexadecimal digits, or two such for the halves of a pair.
    bool readUnicode(std::string& word) {
        const std::size_t start = at_ - 1;
        std::u16string units;
        do {
            at_ += units.empty() ? 1 : 2;
            units += static_cast<char16_t>(number(4, 16));
        } while (units.size() == 1 && (units[0] & 0xFC00U) == 0xD800 && next() == '\\' && next(1) == 'U');
        const bool isPair = units.size() == 2 && (units[1] & 0xFC00U) == 0xDC00;
        const bool isHalf = (units[0] & 0xF800U) == 0xD800 && !isPair;
        if (isHalf) {
            at_ = start;
            return refuse("half a surrogate pair");
        }
        appendUnits(word, units);
        return true;
    }

    /// The number that up to that many digits spell.
    unsigned number(int digits, int base) {
        unsigned value = 0;
        for (int i = 0; i < digits && digitOf(next()) < base; ++i, ++at_)
            value = value * static_cast<unsigned>(base) + static_cast<unsigned>(digitOf(next()));
        return value;
    }

    static void appendUnits(std::string& word, const std::u16string& units) { word += utf8FromUtf16(units); }

    std::string_view text_;
    PropertyListFault& fault_;
    PropertyListPlace* wanted_;
    std::size_t at_ = 0;
    std::size_t values_ = 0;
    bool isFirst_ = false;  // nothing was read in the innermost container yet
    PropertyListBuilder builder_;
};

}  // namespace

std::optional<PropertyList> parseOldStylePropertyList(std::string_view text, PropertyListFault& fault,
                                                      PropertyListPlace* wanted) {
    return Reader(text, fault, wanted).read();
}

}  // namespace qvct
