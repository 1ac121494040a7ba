#include "platform/data/propertylist/XmlPropertyListWriter.h"

#include "platform/data/propertylist/PropertyListBuilder.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdint>
#include <string_view>
#include <vector>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::string_view kHeader =
    "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
    "<!DOCTYPE plist PUBLIC \"-//Apple//DTD PLIST 1.0//EN\" "
    "\"http://www.apple.com/DTDs/PropertyList-1.0.dtd\">\n"
    "<plist version=\"1.0\">\n";

std::string textOfReal(double number) {
    if (std::isnan(number)) return "nan";
    if (std::isinf(number)) return number < 0 ? "-infinity" : "+infinity";
    if (number == 0) return std::signbit(number) ? "-0.0" : "0.0";
    return fmt::format("{:.17g}", number);
}

std::string textOfDate(PropertyList::Date date) {
    using namespace std::chrono;
    const sys_seconds when = sys_days(year(2001) / January / 1) +
                             seconds(static_cast<std::int64_t>(date.secondsSinceReferenceDate));
    const auto midnight = floor<days>(when);
    const year_month_day day(midnight);
    const hh_mm_ss time(when - midnight);
    return fmt::format("{:04}-{:02}-{:02}T{:02}:{:02}:{:02}Z", static_cast<int>(day.year()),
                       static_cast<unsigned>(day.month()), static_cast<unsigned>(day.day()),
                       time.hours().count(), time.minutes().count(), time.seconds().count());
}

class Writer {
  public:
    std::string write(const PropertyList& root) {
        out_ = kHeader;
        enter(root);
        while (!open_.empty()) step();
        out_ += "</plist>\n";
        return std::move(out_);
    }

  private:
    /// A container that is being written.
    struct Visit {
        const PropertyList* container;
        std::size_t next = 0;
    };

    void enter(const PropertyList& value) {
        indent(open_.size());
        const auto* items = value.array();
        const auto* entries = value.dictionary();
        if (items == nullptr && entries == nullptr) return writeLeaf(value);
        const bool isEmpty = items != nullptr ? items->empty() : entries->empty();
        out_ += items != nullptr ? "<array" : "<dict";
        out_ += isEmpty ? "/>\n" : ">\n";
        if (!isEmpty) open_.push_back({&value});
    }

    void step() {
        Visit& visit = open_.back();
        const auto* items = visit.container->array();
        const auto* entries = visit.container->dictionary();
        const std::size_t at = visit.next++;
        if (at == (items != nullptr ? items->size() : entries->size())) {
            open_.pop_back();
            indent(open_.size());
            out_ += items != nullptr ? "</array>\n" : "</dict>\n";
        } else if (items != nullptr) {
            enter((*items)[at]);
        } else {
            const PropertyList::Entry& entry = entries->begin()[at];
            indent(open_.size());
            writeText("key", entry.key);
            enter(entry.value);
        }
    }

    void writeLeaf(const PropertyList& value) {
        if (const std::string* text = value.string()) return writeText("string", *text);
        if (const bool* flag = value.boolean()) return writeLine(*flag ? "<true/>" : "<false/>");
        if (const std::int64_t* number = value.signedInteger()) return writeInteger(*number);
        if (const std::uint64_t* number = value.unsignedInteger()) return writeInteger(*number);
        if (const double* number = value.real())
            return writeLine(fmt::format("<real>{}</real>", textOfReal(*number)));
        if (const PropertyList::Date* date = value.date())
            return writeLine(fmt::format("<date>{}</date>", textOfDate(*date)));
        if (const PropertyList::Uid* uid = value.uid()) return writeUid(*uid);
        writeData(*value.data());
    }

    template <typename Integer>
    void writeInteger(Integer number) {
        writeLine(fmt::format("<integer>{}</integer>", number));
    }

    void writeUid(PropertyList::Uid uid) {
        writeLine("<dict>");
        indent(open_.size() + 1);
        writeText("key", PropertyListBuilder::kUidKey);
        indent(open_.size() + 1);
        writeInteger(uid.value);
        indent(open_.size());
        writeLine("</dict>");
    }

    /// A carriage return is escaped: readers would turn a plain one into a line feed.
    void writeText(std::string_view element, std::string_view text) {
        out_ += fmt::format("<{}>", element);
        for (std::size_t special = 0; (special = text.find_first_of("&<>\r")) != std::string_view::npos;
             text.remove_prefix(special + 1)) {
            out_ += text.substr(0, special);
            const char c = text[special];
            out_ += c == '&' ? "&amp;" : c == '<' ? "&lt;" : c == '>' ? "&gt;" : "&#13;";
        }
        out_ += text;
        out_ += fmt::format("</{}>\n", element);
    }

    /// Base 64 in lines of up to 76 columns, a tab taking eight of them.
    void writeData(const PropertyList::Data& bytes) {
        const std::size_t tabs = std::min(open_.size(), std::size_t{8});
        const std::size_t bytesOfLine = (76 - 8 * tabs) / 4 * 3;
        writeLine("<data>");
        for (std::size_t at = 0; at < bytes.size(); at += 3) {
            if (at % bytesOfLine == 0) {
                if (at > 0) out_ += '\n';
                indent(tabs);
            }
            writeGroup(bytes.data() + at, std::min(bytes.size() - at, std::size_t{3}));
        }
        if (!bytes.empty()) out_ += '\n';
        indent(open_.size());
        writeLine("</data>");
    }

    /// The four characters of up to three bytes.
    void writeGroup(const std::uint8_t* bytes, std::size_t count) {
        constexpr std::string_view digits =
            "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
        const unsigned bits =
            bytes[0] * 0x10000U + (count > 1 ? bytes[1] * 0x100U : 0) + (count > 2 ? bytes[2] : 0U);
        for (std::size_t i = 0; i < 4; ++i) out_ += i <= count ? digits[bits >> (18 - 6 * i) & 0x3FU] : '=';
    }

    void writeLine(std::string_view line) {
        out_ += line;
        out_ += '\n';
    }

    void indent(std::size_t tabs) { out_.append(tabs, '\t'); }

    std::string out_;
    std::vector<Visit> open_;
};

}  // namespace

std::string xmlPropertyList(const PropertyList& value) {
    return Writer().write(value);
}

}  // namespace qvct
