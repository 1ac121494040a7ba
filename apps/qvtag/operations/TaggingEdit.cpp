#include "operations/TaggingEdit.h"

#include "ToolContext.h"
#include "operations/SimilarTags.h"
#include "platform/text/Text.h"
#include "taxonomy/labels/TagNormalization.h"

#include <algorithm>
#include <charconv>
#include <utility>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

std::optional<double> levelOf(std::string_view text) {
    const bool isPercentage = text.ends_with('%');
    if (isPercentage) text.remove_suffix(1);
    double level = 0;
    const auto [end, fault] = std::from_chars(text.data(), text.data() + text.size(), level);
    if (fault != std::errc() || end != text.data() + text.size()) return std::nullopt;
    if (isPercentage) level /= 100;
    return level >= 0 && level <= 1 ? std::optional(level) : std::nullopt;
}

/// Whether the text was meant as a level, valid or not.
bool isMeantAsLevel(std::string_view text) {
    const std::string word = lowercase(text);
    return text.empty() || std::string_view("+-.%0123456789").find(text.front()) != std::string_view::npos ||
           word == "nan" || word == "inf" || word == "infinity";
}

std::string knownCategories(const TGRTTaxonomy& taxonomy) {
    std::vector<std::string> names;
    for (const auto& category : taxonomy.categories()) names.push_back(category->identifier());
    return join(names, ", ");
}

/// What is wrong with adding the tag; empty when nothing is.
std::string problemOf(std::string_view text, const std::optional<TagArgument>& read, bool creates) {
    if (!read) return fmt::format("\"{}\" is no Category/Label", printable(text));
    const TagArgument& argument = *read;
    if (argument.hasWrongLevel) {
        return fmt::format("\"{}\": the level is out of range, which is 0 to 1, or 0% to 100%",
                           printable(text));
    }
    if (creates) return {};
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    if (!taxonomy->findCategoryWithIdentifier(argument.category)) {
        return fmt::format("no category \"{}\"; there are: {}", printable(argument.category),
                           knownCategories(*taxonomy));
    }
    if (taxonomy->findTagForLabel(argument.label, argument.category)) return {};
    return fmt::format("no tag \"{}\" in {}{}", printable(argument.label), argument.category,
                       similarTags(argument.label, taxonomy));
}

/// The label that a text names, alone or behind its category.
struct NamedLabel {
    std::string label;
    std::string problem;  ///< Empty when nothing is wrong.
};

NamedLabel namedLabel(const std::string& text, bool creates) {
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    const bool isText = isValidUtf8(text);
    if (isText && taxonomy->findTagForLabel(text)) return {text, {}};
    const auto argument = TagArgument::parse(text, false);
    if (isText && !creates) {
        if (argument) return {argument->label, problemOf(text, argument, false)};
        return {{}, fmt::format("no tag \"{}\"{}", printable(text), similarTags(text, taxonomy))};
    }
    std::string label = isText ? normalizedTagString(argument ? argument->label : text) : std::string();
    std::string problem = label.empty() ? fmt::format("\"{}\" is no label", printable(text)) : std::string();
    return {std::move(label), std::move(problem)};
}

/// Whether it is one of the labels, or below one.
bool isAtOrBelow(const TGRTTagging& tagging, const std::set<std::string>& labels) {
    if (labels.contains(tagging.label())) return true;
    const auto above = tagging.tag()->ancestors();
    return std::any_of(above.begin(), above.end(),
                       [&labels](const auto& tag) { return labels.contains(tag->label()); });
}

bool isOfTag(const TGRTTagging& tagging, std::string_view category, std::string_view label) {
    return tagging.category() == category && tagging.label() == label;
}

}  // namespace

std::optional<TagArgument> TagArgument::parse(std::string_view text, bool takesLevel) {
    const std::size_t slash = text.find('/');
    if (slash == std::string_view::npos || slash == 0) return std::nullopt;
    if (!isValidUtf8(text)) return std::nullopt;
    TagArgument argument{std::string(text.substr(0, slash)), std::string(text.substr(slash + 1)), {}};
    const std::size_t equals = argument.label.rfind('=');
    if (takesLevel && equals != std::string::npos) {
        const std::string_view level =
            trimBlanksAndLineBreaks(std::string_view(argument.label).substr(equals + 1));
        argument.level = levelOf(level);
        argument.hasWrongLevel = !argument.level && isMeantAsLevel(level);
        if (argument.level) argument.label.resize(equals);
    }
    return argument.label.empty() ? std::nullopt : std::optional(argument);
}

std::string TaggingEdit::add(const std::string& text, bool creates) {
    const auto argument = TagArgument::parse(text, true);
    std::string problem = problemOf(text, argument, creates);
    if (!problem.empty()) return problem;
    const auto tag =
        TGRTTaxonomy::mutableDefaultTaxonomy()->findOrCreateTagWithLabel(argument->label, argument->category);
    auto tagging = TGRTTagging::initWithTag(
        tag, argument->level ? TGRTLevel::levelWithWeight(*argument->level) : nullptr);
    if (!tagging) return fmt::format("\"{}\" is no label", printable(argument->label));
    // Of several levels for one tag the last counts.
    std::erase_if(added_, [&](const auto& earlier) {
        return isOfTag(*earlier, tagging->category(), tagging->label());
    });
    added_.push_back(std::move(tagging));
    return {};
}

std::string TaggingEdit::remove(const std::string& text) {
    auto argument = TagArgument::parse(text, false);
    if (!argument) return fmt::format("\"{}\" is no Category/Label", printable(text));
    const std::string typed = std::exchange(argument->label, normalizedTagString(argument->label));
    if (argument->label.empty()) return fmt::format("\"{}\" is no label", printable(typed));
    removed_.push_back(*argument);
    const bool isAdded = std::any_of(added_.begin(), added_.end(), [&](const auto& added) {
        return isOfTag(*added, argument->category, argument->label);
    });
    return isAdded ? fmt::format("\"{}\" is both added and removed", printable(text)) : "";
}

std::string TaggingEdit::reject(const std::string& text, bool creates) {
    NamedLabel named = namedLabel(text, creates);
    if (!named.problem.empty()) return named.problem;
    rejected_.insert(std::move(named.label));
    const bool isAdded = std::any_of(added_.begin(), added_.end(),
                                     [this](const auto& added) { return isAtOrBelow(*added, rejected_); });
    return isAdded ? fmt::format("\"{}\" is both added and rejected", printable(text)) : "";
}

std::string TaggingEdit::accept(const std::string& text, bool creates) {
    NamedLabel named = namedLabel(text, creates);
    if (!named.problem.empty()) return named.problem;
    const bool isRejected = rejected_.contains(named.label);
    accepted_.insert(std::move(named.label));
    return isRejected ? fmt::format("\"{}\" is both rejected and accepted", printable(text)) : "";
}

std::optional<TaggingEdit> TaggingEdit::make(const TaggingArguments& arguments, ToolContext& context) {
    TaggingEdit edit;
    std::vector<std::string> problems;
    problems.reserve(arguments.add.size() + arguments.remove.size() + arguments.reject.size() +
                     arguments.accept.size());
    for (const std::string& text : arguments.add) problems.push_back(edit.add(text, arguments.creates));
    for (const std::string& text : arguments.remove) problems.push_back(edit.remove(text));
    for (const std::string& text : arguments.reject) problems.push_back(edit.reject(text, arguments.creates));
    for (const std::string& text : arguments.accept) problems.push_back(edit.accept(text, arguments.creates));
    std::erase(problems, "");
    for (const std::string& problem : problems) context.usageFailed(problem);
    return problems.empty() ? std::optional(edit) : std::nullopt;
}

ObjectSet<TGRTTagging> TaggingEdit::apply(const ObjectSet<TGRTTagging>& taggings) const {
    ObjectSet<TGRTTagging> result;
    for (const auto& tagging : taggings) {
        const bool isRemoved = std::any_of(removed_.begin(), removed_.end(), [&](const TagArgument& tag) {
            return isOfTag(*tagging, tag.category, tag.label);
        });
        const bool isReplaced = std::any_of(added_.begin(), added_.end(), [&](const auto& added) {
            return isOfTag(*tagging, added->category(), added->label()) &&
                   (!added->isEqual(*tagging) || tagging->isAutoTagging());
        });
        if (!isRemoved && !isReplaced && !isAtOrBelow(*tagging, rejected_)) result.insert(tagging);
    }
    for (const auto& tagging : added_) result.insert(tagging);
    return result;
}

std::set<std::string> TaggingEdit::apply(std::set<std::string> rejectedLabels) const {
    for (const std::string& label : accepted_) rejectedLabels.erase(label);
    for (const auto& tagging : added_) {
        rejectedLabels.erase(tagging->label());
        for (const auto& above : tagging->tag()->ancestors()) rejectedLabels.erase(above->label());
    }
    rejectedLabels.insert(rejected_.begin(), rejected_.end());
    return rejectedLabels;
}

ObjectSet<TGRTTagging> difference(const ObjectSet<TGRTTagging>& a, const ObjectSet<TGRTTagging>& b) {
    ObjectSet<TGRTTagging> result;
    for (const auto& tagging : a) {
        const TGRTTagging* same = b.find(*tagging);
        if (same == nullptr || same->isAutoTagging() != tagging->isAutoTagging()) result.insert(tagging);
    }
    return result;
}

}  // namespace qvct::tool
