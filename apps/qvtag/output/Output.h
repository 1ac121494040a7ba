#pragma once

#include "taxonomy/TGRTTagging.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include <nlohmann/json.hpp>

namespace qvct::tool {

using Json = nlohmann::ordered_json;

/// Tables for people, one JSON document, or one JSON line an item.
enum class Format { table, json, jsonLines };

/// What standard output can show.
struct Terminal {
    bool hasColor = false;
    /// Columns; 0 when lines need not be broken.
    std::size_t width = 0;

    static Terminal ofStandardOutput();
};

enum class Color { plain, strong, faint, accent };
/// The text in a colour, where the terminal has any.
std::string colored(const Terminal& terminal, Color color, std::string_view text);

/// Adds a member whose key the object does not have yet, without looking for it.
void append(Json& object, std::string key, Json value);
/// A JSON text that stays valid whatever bytes are in its strings.
std::string jsonText(const Json& value, bool onOneLine);
/// Prints the items: as an array, or one a line.
void printJson(const Json& items, Format format);

/// Prints items as they come: as elements of one array, or one a line, so that each can be read at once.
class JsonItems {
  public:
    explicit JsonItems(Format format) : format_(format) {}
    void add(const Json& item);
    /// Closes the array, also when it is empty.
    void finish();

  private:
    Format format_;
    bool isEmpty_ = true;
};

/// A number as it was meant: whole numbers without a fraction, single-precision ones as their shortest
/// decimal.
Json jsonOfNumber(double number);
/// {"label","parent","category","level","auto","weightLevel"}, null where absent.
Json jsonOfTagging(const TGRTTagging& tagging);
/// The taggings sorted by category, label and level, so that output is the same in every run.
std::vector<std::shared_ptr<TGRTTagging>> sortedTaggings(const ObjectSet<TGRTTagging>& taggings);
/// "House", or "Cold / Warm 100%" with a level.
std::string textOfTagging(const TGRTTagging& tagging);

/// "Genres > Electronic Music > House"
std::string pathOfTag(const TGRTTag& tag);

/// "1 item", "2 items"
std::string counted(std::uint64_t count, std::string_view thing);

/// Pads with blanks to that many columns of a terminal.
std::string padded(std::string_view text, std::size_t columns);
/// Joins words with two blanks, breaking lines before `width` columns; further lines are indented. No breaks
/// for a width of 0. Words may hold colour.
struct Word {
    std::string text;
    Color color = Color::plain;
};
std::string wrapped(const Terminal& terminal, const std::vector<Word>& words, std::size_t indent);

}  // namespace qvct::tool
