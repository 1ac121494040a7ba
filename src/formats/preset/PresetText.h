#pragma once

#include "platform/base/Error.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// Largest preset that is read or written; presets are a few kilobytes.
inline constexpr std::uint64_t kLargestPreset = 16ULL << 20U;

/// The text of a synth preset (docs/formats/synth-preset.md): lines in sections, of which we read and rewrite
/// those that we know. All others come out byte for byte, in their order, line ends included.
class PresetText {
  public:
    /// "key = value" of a section, both unescaped.
    struct Item {
        std::string key;
        std::string value;
        bool operator==(const Item&) const = default;
    };
    using Items = std::vector<Item>;

    /// Nothing, and an error with the line, when the text is not UTF-8. Sections that are not closed reach to
    /// the next one.
    static std::optional<PresetText> parse(std::string_view text, Error* error = nullptr);

    /// The items of all sections of that name, in their order; lines that are no items are passed over.
    Items items(std::string_view section) const;

    /// One section as it stands in the text, from its opening to its closing line.
    struct Section {
        std::string name;
        std::uint64_t offset = 0;  ///< In bytes.
        std::uint64_t size = 0;
        Items items;
        bool isClosed = false;
    };
    std::vector<Section> sections() const;

    /// Replaces the marked items of a section (`isReplaced` has one entry for each of `items`) by
    /// `replacement`. That takes the place of the first marked item, or else follows the section's last line;
    /// but it always comes after all other items that have one of the `keys`, lest these be read as parts of
    /// it. A missing section is added at the end, unless there is nothing to put into it.
    void setItems(std::string_view section, const std::vector<std::string_view>& keys,
                  const std::vector<bool>& isReplaced, const Items& replacement);

    /// The line of the first section that is not closed; such a text cannot be rewritten with certainty.
    std::optional<std::size_t> firstUnclosedSection() const { return firstUnclosed_; }

    std::string text() const;

  private:
    struct Line {
        std::string bytes;    // with what ends it
        std::string section;  // the one it belongs to, as its opening and closing lines do; else empty
        enum { opening, inside, closing } role = inside;
    };

    static std::optional<Item> itemOfLine(std::string_view line);
    std::string lineOf(const Item& item) const;
    void appendSection(std::string_view section, const Items& items);

    std::vector<Line> lines_;
    std::string lineEnd_ = "\n";
    std::optional<std::size_t> firstUnclosed_;
};

}  // namespace qvct
