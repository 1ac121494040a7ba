#include "platform/data/propertylist/PropertyListGuard.h"

#include "platform/base/bytes/ByteOrder.h"
#include "platform/data/PropertyListFile.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <bit>
#include <string_view>
#include <utility>
#include <vector>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::size_t kHeaderSize = 8;
constexpr std::size_t kTrailerSize = 32;
/// Most bytes of data, and of texts as UTF-8. They may exceed the file's size, since equal ones are often
/// stored once and two bytes of UTF-16 become three of UTF-8. While the list is read, memory holds two copies
/// of them.
constexpr std::uint64_t mostPayload(std::size_t size) {
    return (std::uint64_t{8} << 20U) + std::uint64_t{size} / 2 * 3;
}

/// What one object of a binary property list is, read without looking past the end.
struct Object {
    enum class Kind { leaf, array, dictionary } kind = Kind::leaf;
    std::size_t offset = 0;          // of its marker
    std::size_t textUnit = 0;        // bytes of a character; 0 for what is no text
    std::uint64_t count = 0;         // references of a container (keys and values of a dictionary)
    std::size_t firstReference = 0;  // offset of a container's references
    std::uint64_t payload = 0;       // bytes of a leaf
};

/// The object graph of a binary property list.
class BinaryGraph {
  public:
    explicit BinaryGraph(std::span<const std::uint8_t> bytes) : bytes_(bytes) {}

    std::optional<PropertyListFault> check() {
        if (!readTrailer() || !walk()) return fault_;
        return std::nullopt;
    }

  private:
    /// Totals of an object with all that it holds.
    struct Totals {
        std::uint64_t values = 0;
        std::uint64_t payload = 0;
        int depth = 0;
    };
    /// A container whose references are being walked.
    struct Visit {
        std::uint64_t index;
        Object object;
        std::uint64_t next = 0;
        Totals totals{1, 0, 1};
    };
    enum class State : std::uint8_t { unseen, open, done };

    bool refuse(ErrorCode code, std::size_t offset, std::string reason) {
        fault_ = {code, offset, std::move(reason)};
        return false;
    }

    std::uint64_t bigEndian(std::size_t offset, std::size_t width) const {
        return numberOf(bytes_.subspan(offset, width), ByteOrder::big);
    }

    bool readTrailer() {
        if (bytes_.size() < kHeaderSize + kTrailerSize)
            return refuse(kErrorMalformed, bytes_.size(), "is cut short");
        const std::size_t trailer = bytes_.size() - kTrailerSize;
        offsetWidth_ = bytes_[trailer + 6];
        referenceWidth_ = bytes_[trailer + 7];
        objectCount_ = bigEndian(trailer + 8, 8);
        topObject_ = bigEndian(trailer + 16, 8);
        const std::uint64_t table = bigEndian(trailer + 24, 8);
        const bool widthsFit =
            offsetWidth_ >= 1 && offsetWidth_ <= 8 && referenceWidth_ >= 1 && referenceWidth_ <= 8;
        if (!widthsFit) return refuse(kErrorMalformed, trailer + 6, "impossible integer sizes");
        if (table < kHeaderSize || table > trailer)
            return refuse(kErrorMalformed, trailer + 24, "offset table outside");
        if (objectCount_ == 0 || objectCount_ > (trailer - table) / offsetWidth_) {
            return refuse(kErrorMalformed, trailer + 8, "more objects than bytes");
        }
        if (topObject_ >= objectCount_) return refuse(kErrorMalformed, trailer + 16, "top object outside");
        table_ = static_cast<std::size_t>(table);
        return true;
    }

    /// Reads the marker and length of an object; false when it does not lie inside the bytes.
    bool readObject(std::uint64_t index, Object& object) {
        const std::size_t place = table_ + static_cast<std::size_t>(index) * offsetWidth_;
        const std::uint64_t offset = bigEndian(place, offsetWidth_);
        if (offset < kHeaderSize || offset >= table_) {
            return refuse(kErrorMalformed, place,
                          fmt::format("object {} at offset {} outside", index, offset));
        }
        object.offset = static_cast<std::size_t>(offset);
        std::size_t at = object.offset;
        const std::uint8_t marker = bytes_[at++];
        std::uint64_t length = marker & 0x0fU;
        const unsigned type = marker >> 4U;
        const bool counted = type >= 0x4 && type != 0x8;
        if (counted && length == 0x0f && !readLength(at, length)) return false;
        return describe(type, length, at, object);
    }

    /// A length of 15 or more is an integer object of its own behind the marker.
    bool readLength(std::size_t& at, std::uint64_t& length) {
        const std::size_t place = at;
        const std::uint8_t marker = bytes_[at++];  // at is at most the start of the offset table
        const std::size_t width = std::size_t{1} << (marker & 0x0fU);
        if (marker >> 4U != 0x1 || width > 8 || width > table_ - std::min(at, table_)) {
            return refuse(kErrorMalformed, place, "impossible length");
        }
        length = bigEndian(at, width);
        at += width;
        return true;
    }

    bool describe(unsigned type, std::uint64_t length, std::size_t at, Object& object) {
        const std::uint64_t available = table_ - std::min(at, table_);
        std::uint64_t unit = 1;
        switch (type) {
            case 0x0:
                length = 0;
                break;  // boolean and fill
            case 0x1:
            case 0x2:
            case 0x3:
                length = std::uint64_t{1} << length;
                break;  // integer, real, date
            case 0x4:
            case 0x5:
                break;  // data, ASCII
            case 0x6:
                unit = 2;
                break;  // UTF-16
            case 0x8:
                length += 1;
                break;  // UID
            case 0xA:
            case 0xC:
                unit = referenceWidth_;
                object.kind = Object::Kind::array;
                break;
            case 0xD:
                unit = 2 * referenceWidth_;
                object.kind = Object::Kind::dictionary;
                break;
            default:
                return refuse(kErrorMalformed, object.offset, fmt::format("unknown marker {:#x}", type));
        }
        if (length > available / unit)
            return refuse(kErrorMalformed, object.offset, "object longer than the file");
        object.firstReference = at;
        object.count = object.kind == Object::Kind::dictionary ? 2 * length : length;
        object.payload = object.kind == Object::Kind::leaf ? length * unit : 0;
        object.textUnit = type == 0x5 || type == 0x6 ? unit : 0;
        return checkLeaf(type, length, at);
    }

    bool checkLeaf(unsigned type, std::uint64_t length, std::size_t at) {
        if (type == 0x5 && !isAscii(textAt(at, length)) && !isValidUtf8(textAt(at, length)))
            return refuse(kErrorMalformed, at, "a text is not valid Unicode");
        if (type == 0x6 && !isPairedUtf16(at, length))
            return refuse(kErrorMalformed, at, "half a surrogate pair");
        const bool isDate = type == 0x3 && length == 8;
        if (isDate && !isPropertyListDate(std::bit_cast<double>(bigEndian(at, 8))))
            return refuse(kErrorMalformed, at, "a date outside the years 1 to 9999");
        return true;
    }

    std::string_view textAt(std::size_t at, std::uint64_t length) const {
        return {reinterpret_cast<const char*>(bytes_.data()) + at, static_cast<std::size_t>(length)};
    }

    bool isPairedUtf16(std::size_t at, std::uint64_t units) const {
        bool openPair = false;
        for (std::uint64_t i = 0; i < units; ++i) {
            const std::uint64_t kind = bigEndian(at + 2 * static_cast<std::size_t>(i), 2) & 0xFC00U;
            const bool isSecondHalf = kind == 0xDC00;
            if (openPair != isSecondHalf) return false;
            openPair = kind == 0xD800;
        }
        return !openPair;
    }

    /// The library aborts the process at a key with a NUL character.
    bool isKey(std::uint64_t index, std::size_t place) {
        Object object;
        if (!readObject(index, object)) return false;
        bool isText = object.textUnit > 0;
        for (std::uint64_t i = 0; isText && i < object.payload; i += object.textUnit) {
            isText = bigEndian(object.firstReference + static_cast<std::size_t>(i), object.textUnit) != 0;
        }
        return isText || refuse(kErrorMalformed, place, "a key that is no text, or holds a NUL character");
    }

    bool walk() {
        states_.assign(static_cast<std::size_t>(objectCount_), State::unseen);
        totals_.resize(static_cast<std::size_t>(objectCount_));
        if (!enter(topObject_)) return false;
        while (!open_.empty()) {
            Visit& visit = open_.back();
            if (visit.next == visit.object.count) {
                close();
            } else if (!step(visit)) {
                return false;
            }
        }
        return true;
    }

    bool step(Visit& visit) {
        const std::size_t place =
            visit.object.firstReference + static_cast<std::size_t>(visit.next) * referenceWidth_;
        const std::uint64_t child = bigEndian(place, referenceWidth_);
        if (child >= objectCount_) return refuse(kErrorMalformed, place, "reference outside");
        const State state = states_[static_cast<std::size_t>(child)];
        if (state == State::open) return refuse(kErrorMalformed, place, "a container holds itself");
        if (state == State::unseen) return enter(child);
        const bool isKeyPlace =
            visit.object.kind == Object::Kind::dictionary && visit.next < visit.object.count / 2;
        ++visit.next;
        return add(visit, totals_[static_cast<std::size_t>(child)], place) &&
               (!isKeyPlace || isKey(child, place));
    }

    bool enter(std::uint64_t index) {
        Object object;
        if (!readObject(index, object)) return false;
        if (object.kind == Object::Kind::leaf) {
            states_[static_cast<std::size_t>(index)] = State::done;
            const std::uint64_t payload = object.textUnit == 2 ? object.payload / 2 * 3 : object.payload;
            totals_[static_cast<std::size_t>(index)] = {1, payload, 0};
            return true;
        }
        states_[static_cast<std::size_t>(index)] = State::open;
        if (open_.size() >= static_cast<std::size_t>(kDeepestPropertyList)) {
            return refuse(kErrorTooLarge, object.offset, "nested too deeply");
        }
        open_.push_back(Visit{index, object});
        ++expanded_.values;
        return true;
    }

    void close() {
        const Visit& visit = open_.back();
        expanded_.values -= visit.totals.values;  // adding them to the container below counts them again
        expanded_.payload -= visit.totals.payload;
        states_[static_cast<std::size_t>(visit.index)] = State::done;
        totals_[static_cast<std::size_t>(visit.index)] = visit.totals;
        open_.pop_back();
    }

    bool add(Visit& visit, const Totals& child, std::size_t place) {
        for (Totals* totals : {&visit.totals, &expanded_}) {
            totals->values += child.values;
            totals->payload += child.payload;
        }
        visit.totals.depth = std::max(visit.totals.depth, child.depth + 1);
        if (expanded_.values > mostPropertyListValues(bytes_.size()))
            return refuse(kErrorTooLarge, place, "too many keys and values");
        if (expanded_.payload > mostPayload(bytes_.size()))
            return refuse(kErrorTooLarge, place, "shared references expand without bound");
        if (visit.totals.depth > kDeepestPropertyList)
            return refuse(kErrorTooLarge, place, "nested too deeply");
        return true;
    }

    std::span<const std::uint8_t> bytes_;
    PropertyListFault fault_;
    std::size_t offsetWidth_ = 0;
    std::size_t referenceWidth_ = 0;
    std::uint64_t objectCount_ = 0;
    std::uint64_t topObject_ = 0;
    std::size_t table_ = 0;
    std::vector<State> states_;
    std::vector<Totals> totals_;
    std::vector<Visit> open_;
    Totals expanded_;  // what the open containers hold so far
};

}  // namespace

std::optional<PropertyListFault> faultOfBinaryPropertyList(std::span<const std::uint8_t> bytes) {
    return BinaryGraph(bytes).check();
}

}  // namespace qvct
