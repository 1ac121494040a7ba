#include "CommandLine.h"
#include "Services.h"
#include "TaggerOptions.h"
#include "ToolContext.h"
#include "autotagging/ContentItem.h"
#include "autotagging/ItemTagger.h"
#include "commands/Commands.h"
#include "metadata/TGRTMetaData.h"
#include "output/StandardStreams.h"
#include "output/TaggingWords.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <memory>
#include <utility>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

struct Options {
    std::vector<std::string> paths;
    LinksOutside links = LinksOutside::files;
    TaggerOptions tagger;
};

std::string_view nameOf(SoundKind kind) {
    return kind == SoundKind::loop ? "loop" : "one-shot";
}

Json jsonOfConfidence(double confidence) {
    return std::round(confidence * 1000) / 1000;
}

Json jsonOfClaims(const std::vector<TagClaim>& claims) {
    Json list = Json::array();
    for (const TagClaim& claim : claims) {
        Json json;
        json["service"] = claim.service;
        json["what"] = claim.evidence.what;
        json["where"] = claim.evidence.where;
        json["confidence"] = jsonOfConfidence(claim.confidence);
        list.push_back(std::move(json));
    }
    return list;
}

using Stored = ObjectSet<TGRTTagging>;

Json jsonOfItem(const URL& url, const Stored& stored, const ItemReport& report) {
    Json json;
    json["path"] = url.path();
    json["kind"] = report.kind == SoundKind::unsaid ? Json() : Json(nameOf(report.kind));
    json["tempo"] = report.tempo ? jsonOfNumber(*report.tempo) : Json();
    json["tempoFromLength"] = report.isTempoFromLength;
    json["beats"] = report.beats ? Json(*report.beats) : Json();
    json["taggings"] = Json::array();
    for (const auto& tagging : sortedTaggings(stored)) {
        Json its = jsonOfTagging(*tagging);
        its["state"] = "stored";
        its["confidence"] = 1;
        its["evidence"] = Json::array();
        json["taggings"].push_back(std::move(its));
    }
    for (const HeldTag& held : report.resolution.held) {
        Json its = jsonOfTagging(*held.tagging());
        its["state"] = held.claims.empty() ? "parent" : "derived";
        its["confidence"] = jsonOfConfidence(held.confidence);
        its["evidence"] = jsonOfClaims(held.claims);
        json["taggings"].push_back(std::move(its));
    }
    json["dropped"] = Json::array();
    for (const DroppedTag& dropped : report.resolution.dropped) {
        Json its;
        its["label"] = dropped.label;
        its["confidence"] = jsonOfConfidence(dropped.confidence);
        its["reason"] = dropped.reason;
        its["evidence"] = jsonOfClaims(dropped.claims);
        json["dropped"].push_back(std::move(its));
    }
    return json;
}

/// Takes out what a person rejected for a folder and what an earlier run may have stored.
Stored withoutRejected(const Stored& stored, ItemReport& report) {
    Stored kept;
    for (const auto& tagging : stored) {
        std::string reason = report.rejections.reasonFor(*tagging->tag());
        if (reason.empty()) {
            kept.insert(tagging);
        } else {
            report.resolution.dropped.push_back({tagging->label(), 1, std::move(reason), {}});
        }
    }
    return kept;
}

/// "Kick" in the name, rule 3, user
std::string textOf(const TagClaim& claim) {
    const auto& [what, where, offset] = claim.evidence;
    const bool isOfName = claim.service == "names" || claim.service == "keywords";
    if (!isOfName)
        return where.empty() ? std::string(claim.service) : fmt::format("{}: {}", where, printable(what));
    const std::string place =
        claim.distance == 0 ? "the name" : fmt::format("the folder \"{}\"", printable(where));
    return fmt::format("\"{}\" in {}", printable(what), place);
}

/// What speaks for a tag, each thing once.
std::string textOf(const std::vector<TagClaim>& claims) {
    std::vector<std::string> texts;
    for (const TagClaim& claim : claims) {
        std::string text = textOf(claim);
        const bool isNew = std::find(texts.begin(), texts.end(), text) == texts.end();
        if (isNew && claim.doubt.empty()) texts.push_back(std::move(text));
    }
    return join(texts, ", ");
}

constexpr std::string_view kStored = "stored in the file";

struct Line {
    std::string tag;
    std::string confidence;
    std::string why;
    Color color = Color::plain;
};

std::string percent(double confidence) {
    return fmt::format("{:.0f} %", confidence * 100);
}

std::vector<Line> linesOf(const Stored& stored, const ItemReport& report) {
    std::vector<Line> lines;
    for (const auto& tagging : sortedTaggings(stored))
        lines.push_back({textOfTagging(*tagging), "", std::string(kStored)});
    std::vector<const HeldTag*> held;
    for (const HeldTag& tag : report.resolution.held) held.push_back(&tag);
    const auto rank = [](const HeldTag* tag) {
        return rankOfTag(tag->tag->categoryIdentifier(), tag->tag->label());
    };
    std::stable_sort(held.begin(), held.end(), [&rank](auto* a, auto* b) { return rank(a) < rank(b); });
    for (const HeldTag* tag : held) {
        const bool isParent = tag->claims.empty();
        lines.push_back({textOfTagging(*tag->tagging()), percent(tag->confidence),
                         isParent ? "belongs to another" : textOf(tag->claims),
                         isParent || isBookkeeping(rank(tag)) ? Color::faint : Color::strong});
    }
    for (const DroppedTag& tag : report.resolution.dropped)
        lines.push_back({"not " + printable(tag.label), percent(tag.confidence),
                         fmt::format("{}: {}", tag.reason,
                                     tag.claims.empty() ? std::string(kStored) : textOf(tag.claims.front())),
                         Color::faint});
    return lines;
}

void printItem(const URL& url, const Stored& stored, const ItemReport& report, const Terminal& terminal) {
    print("{}", colored(terminal, Color::strong, printable(url.path())));
    if (report.kind != SoundKind::unsaid) print("  {}", nameOf(report.kind));
    if (report.tempo) print("  {:g} bpm", *report.tempo);
    if (report.beats)
        print("{}{} beats", report.isTempoFromLength ? ", since it is as long as " : "  ", *report.beats);
    print("\n");
    const std::vector<Line> lines = linesOf(stored, report);
    std::size_t width = 0;
    for (const Line& line : lines) width = std::max(width, displayWidth(line.tag));
    for (const Line& line : lines)
        print("  {}  {:>5}  {}\n", colored(terminal, line.color, padded(line.tag, width)), line.confidence,
              colored(terminal, line.color == Color::faint ? Color::faint : Color::plain, line.why));
    if (lines.empty()) print("  {}\n", colored(terminal, Color::faint, "nothing is known of it"));
}

void run(const Options& options, ToolContext& context) {
    const auto bits = optionsForServices(options.tagger.services, context);
    ItemTagger tagger(options.tagger.aggregator(context), TGRTTaxonomy::defaultTaxonomy());
    JsonItems json(context.format);
    context.forEachContentItemBelow(
        options.paths, options.links, [&](const URL& url, const std::string& root) {
            const auto item = std::make_shared<ContentItem>(url, ContentItem::Reading{bits, nullptr});
            const auto record = item->record();
            ItemReport report = tagger.report(item, ItemNames(url.path(), root), bits);
            const Stored stored = withoutRejected(record ? record->taggings() : Stored(), report);
            if (context.format == Format::table) {
                printItem(url, stored, report, context.terminal());
            } else {
                json.add(jsonOfItem(url, stored, report));
            }
        });
    if (context.format != Format::table) json.finish();
}

}  // namespace

void addExplainCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command = tool.addCommand("explain", "Shows why each tag is there, and what was dropped and why");
    command.addOption("paths", options->paths, "Files and folders").required().valueName("PATH");
    command.addFollowFlag(options->links);
    options->tagger.addTo(command);
    command.footer("Example:\n  qvtag explain \"Drums/BD0010.wav\"");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool
