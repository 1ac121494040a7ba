#include "formats/preset/PresetText.h"

#include "platform/text/Text.h"

#include <algorithm>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::string_view kByteOrderMark = "\xef\xbb\xbf";
constexpr std::string_view kSeparator = " = ";

std::string_view withoutLineEnd(std::string_view line) {
    if (line.ends_with('\n')) line.remove_suffix(1);
    if (line.ends_with('\r')) line.remove_suffix(1);
    return line;
}

/// "name" of the line "<name>" or "</name>", slash included; nothing for others.
std::optional<std::string_view> tagOfLine(std::string_view line) {
    line = trimBlanks(withoutLineEnd(line));
    if (line.size() < 3 || line.front() != '<' || line.back() != '>') return std::nullopt;
    line = line.substr(1, line.size() - 2);
    const std::string_view name = line.substr(line.front() == '/' ? 1 : 0);
    const bool isName = !name.empty() && std::all_of(name.begin(), name.end(), isAsciiWordCharacter);
    return isName ? std::optional(line) : std::nullopt;
}

/// Line breaks would end the value, and a separator in it could be taken for that of a key.
std::string escaped(std::string_view text) {
    std::string result;
    for (const char c : text) {
        switch (c) {
            case '\\':
                result += "\\\\";
                break;
            case '\n':
                result += "\\n";
                break;
            case '\r':
                result += "\\r";
                break;
            case '=':
                result += "\\=";
                break;
            default:
                result += c;
        }
    }
    return result;
}

std::string unescaped(std::string_view text) {
    std::string result;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const char next = text[i] == '\\' && i + 1 < text.size() ? text[i + 1] : '\0';
        const std::size_t known = std::string_view("\\nr=").find(next);
        if (next == '\0' || known == std::string_view::npos) {
            result += text[i];
        } else {
            result += "\\\n\r="[known];
            ++i;
        }
    }
    return result;
}

}  // namespace

std::optional<PresetText> PresetText::parse(std::string_view text, Error* error) {
    PresetText preset;
    std::string open;
    std::size_t opened = 0;
    const auto leaveOpen = [&] {
        if (!open.empty() && !preset.firstUnclosed_) preset.firstUnclosed_ = opened;
    };
    for (std::size_t start = 0; start < text.size();) {
        const std::size_t end = std::min(text.find('\n', start), text.size() - 1) + 1;
        Line line{std::string(text.substr(start, end - start)), open};
        start = end;
        if (!isValidUtf8(line.bytes)) {
            fail(error, kErrorMalformed, "not UTF-8", {.line = preset.lines_.size() + 1});
            return std::nullopt;
        }
        std::string_view visible = line.bytes;
        if (preset.lines_.empty() && visible.starts_with(kByteOrderMark)) visible.remove_prefix(3);
        const auto tag = tagOfLine(visible);
        if (tag && tag->front() != '/') {
            leaveOpen();
            open = *tag;
            opened = preset.lines_.size() + 1;
            line.section = open;
            line.role = Line::opening;
        } else if (tag && !open.empty() && tag->substr(1) == open) {
            line.role = Line::closing;
            open.clear();
        }
        preset.lines_.push_back(std::move(line));
    }
    leaveOpen();
    if (!preset.lines_.empty() && preset.lines_.front().bytes.ends_with("\r\n")) preset.lineEnd_ = "\r\n";
    return preset;
}

std::optional<PresetText::Item> PresetText::itemOfLine(std::string_view line) {
    line = withoutLineEnd(line);
    const std::size_t separator = line.find(kSeparator);
    if (separator == std::string_view::npos) return std::nullopt;
    return Item{unescaped(line.substr(0, separator)), unescaped(line.substr(separator + kSeparator.size()))};
}

PresetText::Items PresetText::items(std::string_view section) const {
    Items result;
    for (const Line& line : lines_) {
        if (line.section != section || line.role != Line::inside) continue;
        if (auto item = itemOfLine(line.bytes)) result.push_back(std::move(*item));
    }
    return result;
}

std::vector<PresetText::Section> PresetText::sections() const {
    std::vector<Section> result;
    std::uint64_t offset = 0;
    for (const Line& line : lines_) {
        if (line.role == Line::opening) result.push_back({line.section, offset, 0, {}, false});
        if (!line.section.empty()) {
            Section& section = result.back();
            section.size += line.bytes.size();
            section.isClosed = line.role == Line::closing;
            auto item = line.role == Line::inside ? itemOfLine(line.bytes) : std::nullopt;
            if (item) section.items.push_back(std::move(*item));
        }
        offset += line.bytes.size();
    }
    return result;
}

std::string PresetText::lineOf(const Item& item) const {
    return escaped(item.key) + std::string(kSeparator) + escaped(item.value) + lineEnd_;
}

void PresetText::setItems(std::string_view section, const std::vector<std::string_view>& keys,
                          const std::vector<bool>& isReplaced, const Items& replacement) {
    std::vector<Line> lines;
    std::size_t index = 0;
    std::optional<std::size_t> place;
    std::optional<std::size_t> end;  // of the section's first occurrence
    for (Line& line : lines_) {
        const bool isInside = line.section == section;
        if (isInside && line.role == Line::closing && !end) end = lines.size();
        const auto item = isInside && line.role == Line::inside ? itemOfLine(line.bytes) : std::nullopt;
        const bool isGone = item && isReplaced[index++];
        if (isGone && !place) place = lines.size();
        if (isGone) continue;
        lines.push_back(std::move(line));
        if (item && std::find(keys.begin(), keys.end(), item->key) != keys.end()) place = lines.size();
    }
    lines_ = std::move(lines);
    if (!place) place = end;
    if (!place) return appendSection(section, replacement);
    std::vector<Line> added;
    for (const Item& item : replacement) added.push_back({lineOf(item), std::string(section)});
    lines_.insert(lines_.begin() + static_cast<std::ptrdiff_t>(*place), added.begin(), added.end());
}

void PresetText::appendSection(std::string_view section, const Items& items) {
    if (items.empty()) return;
    if (!lines_.empty() && !lines_.back().bytes.ends_with('\n')) lines_.back().bytes += lineEnd_;
    lines_.push_back({fmt::format("<{}>{}", section, lineEnd_), std::string(section), Line::opening});
    for (const Item& item : items) lines_.push_back({lineOf(item), std::string(section)});
    lines_.push_back({fmt::format("</{}>{}", section, lineEnd_), std::string(section), Line::closing});
}

std::string PresetText::text() const {
    std::string result;
    for (const Line& line : lines_) result += line.bytes;
    return result;
}

}  // namespace qvct
