#include "output/Output.h"

#include "output/StandardStreams.h"
#include "platform/processes/StandardStreams.h"
#include "platform/text/Decimal.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <tuple>

#include <fmt/format.h>

namespace qvct::tool {

Terminal Terminal::ofStandardOutput() {
    Terminal terminal;
    if (!isTerminal(StandardStream::output)) return terminal;
    constexpr std::size_t usual = 80;
    terminal.width = columnsOf(StandardStream::output).value_or(usual);
    terminal.hasColor = std::getenv("NO_COLOR") == nullptr;
    return terminal;
}

std::string colored(const Terminal& terminal, Color color, std::string_view text) {
    if (!terminal.hasColor || color == Color::plain) return std::string(text);
    const char* code = color == Color::strong ? "1" : color == Color::faint ? "2" : "36";
    return fmt::format("\x1b[{}m{}\x1b[0m", code, text);
}

void append(Json& object, std::string key, Json value) {
    object.get_ref<Json::object_t&>().emplace_back(std::move(key), std::move(value));
}

std::string jsonText(const Json& value, bool onOneLine) {
    return value.dump(onOneLine ? -1 : 2, ' ', false, Json::error_handler_t::replace);
}

void JsonItems::add(const Json& item) {
    if (format_ == Format::jsonLines) {
        printText(jsonText(item, true) + "\n");
        flushOutput();
    } else {
        printText((isEmpty_ ? "[\n  " : ",\n  ") + replaceAll(jsonText(item, false), "\n", "\n  "));
    }
    isEmpty_ = false;
}

void JsonItems::finish() {
    if (format_ != Format::jsonLines) printText(isEmpty_ ? "[]\n" : "\n]\n");
}

void printJson(const Json& items, Format format) {
    if (!items.is_array()) return printText(jsonText(items, format == Format::jsonLines) + "\n");
    JsonItems printed(format);
    for (const Json& item : items) printed.add(item);
    printed.finish();
}

Json jsonOfNumber(double number) {
    constexpr double exact = 9007199254740992;  // up to which every whole number has its own double
    if (std::trunc(number) == number && std::abs(number) <= exact) return static_cast<std::int64_t>(number);
    return decimalOf(number);
}

Json jsonOfTagging(const TGRTTagging& tagging) {
    Json json;
    json["label"] = tagging.label();
    json["parent"] = tagging.parentLabel().empty() ? Json() : Json(tagging.parentLabel());
    json["category"] = tagging.category();
    json["level"] = tagging.level() ? Json(tagging.level()->weight()) : Json();
    json["auto"] = tagging.isAutoTagging();
    json["weightLevel"] = tagging.weightLevel();
    return json;
}

std::vector<std::shared_ptr<TGRTTagging>> sortedTaggings(const ObjectSet<TGRTTagging>& taggings) {
    std::vector<std::shared_ptr<TGRTTagging>> sorted(taggings.begin(), taggings.end());
    const auto key = [](const TGRTTagging& t) {
        return std::make_tuple(t.category(), t.label(), t.level() ? t.level()->weight() : -1.0);
    };
    std::stable_sort(sorted.begin(), sorted.end(),
                     [&](const auto& a, const auto& b) { return key(*a) < key(*b); });
    return sorted;
}

std::string textOfTagging(const TGRTTagging& tagging) {
    std::string label = printable(tagging.label());
    if (!tagging.level()) return label;
    return fmt::format("{} {}%", label, std::lround(tagging.level()->weight() * 100));
}

std::string pathOfTag(const TGRTTag& tag) {
    std::string path = tag.label();
    for (const auto& ancestor : tag.ancestors()) path.insert(0, ancestor->label() + " > ");
    return printable(tag.categoryIdentifier() + " > " + path);
}

std::string counted(std::uint64_t count, std::string_view thing) {
    return fmt::format("{} {}{}", count, thing, count == 1 ? "" : "s");
}

std::string padded(std::string_view text, std::size_t columns) {
    const std::size_t width = displayWidth(text);
    return std::string(text) + std::string(columns > width ? columns - width : 0, ' ');
}

std::string wrapped(const Terminal& terminal, const std::vector<Word>& words, std::size_t indent) {
    constexpr std::size_t gap = 2;
    std::string result;
    std::size_t column = indent;
    for (const Word& word : words) {
        const std::size_t width = displayWidth(word.text);
        const bool isFirst = column == indent;
        if (!isFirst && terminal.width != 0 && column + gap + width > terminal.width) {
            result += "\n" + std::string(indent, ' ');
            column = indent;
        } else if (!isFirst) {
            result += std::string(gap, ' ');
            column += gap;
        }
        result += colored(terminal, word.color, word.text);
        column += width;
    }
    return result;
}

}  // namespace qvct::tool
