#include "autotagging/evidence/ClaimResolver.h"

#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <tuple>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

using TagPointer = std::shared_ptr<TGRTTag>;

/// A tag that is claimed, on its way to a decision.
struct Candidate {
    TagPointer tag;
    std::vector<TagClaim> claims;
    double confidence = 0;
    int distance = 0;    // of the nearest claim
    std::string reason;  // why it is dropped; empty while it is not
};

using Candidates = std::vector<Candidate>;

bool isAncestor(const TGRTTag& above, const TGRTTag& tag) {
    for (auto parent = tag.parent(); parent; parent = parent->parent())
        if (parent.get() == &above) return true;
    return false;
}

bool areRelated(const Candidate& a, const Candidate& b) {
    return a.tag == b.tag || isAncestor(*a.tag, *b.tag) || isAncestor(*b.tag, *a.tag);
}

/// The tags of which one item can have only one, by their parent.
bool isAlternative(const TGRTTag& tag) {
    const auto parent = tag.parent();
    return parent && (parent->label() == QVTagKey || parent->label() == QVTagKeyType ||
                      parent->label() == QVTagTimeSignature);
}

std::string rootLabel(const TGRTTag& tag) {
    const auto ancestors = tag.ancestors();
    return ancestors.empty() ? tag.label() : ancestors.back()->label();
}

bool isInstrument(const TGRTTag& tag) {
    return tag.categoryIdentifier() == QVCategorySourceIdentifier;
}

/// What several sources say together, if each knows nothing of the others.
double together(double a, double b) {
    return 1 - (1 - a) * (1 - b);
}

class Decision {
  public:
    Decision(const TGRTTaxonomy& taxonomy, const EvidenceWeights& weights)
        : taxonomy_(taxonomy), weights_(weights) {}

    Resolution decide(std::vector<TagClaim> claims, SoundKind kind) {
        gather(std::move(claims));
        for (Candidate& candidate : candidates_) weigh(candidate);
        support();
        decideAlternatives();
        decideInstruments(kind);
        for (Candidate& candidate : candidates_) {
            if (candidate.reason.empty() && candidate.confidence < weights_.threshold)
                candidate.reason = "too unsure";
        }
        return result();
    }

  private:
    /// The same claims in whatever order give the same candidates.
    void gather(std::vector<TagClaim> claims) {
        const auto order = [](const TagClaim& claim) {
            return std::tie(claim.label, claim.distance, claim.service, claim.evidence.offset,
                            claim.evidence.what, claim.evidence.where, claim.confidence, claim.level,
                            claim.doubt);
        };
        std::sort(claims.begin(), claims.end(),
                  [&order](const TagClaim& a, const TagClaim& b) { return order(a) < order(b); });
        for (TagClaim& claim : claims) {
            if (candidates_.empty() || candidates_.back().claims.back().label != claim.label)
                candidates_.push_back({taxonomy_.findTagForLabel(claim.label), {}, 0, claim.distance, {}});
            candidates_.back().claims.push_back(std::move(claim));
        }
    }

    double weightOf(const TagClaim& claim) const {
        const double weight =
            claim.confidence * weights_.ofService(claim.service) * weights_.ofDistance(claim.distance);
        return claim.isHead ? together(weight, weights_.headWord) : weight;
    }

    /// Keywords and naming habits read the same words: they are one source. The name of an item and those of
    /// its folders are several.
    struct Source {
        std::string_view service;
        int distance;
        friend bool operator==(const Source&, const Source&) = default;
    };
    static Source sourceOf(const TagClaim& claim) {
        return {claim.service == "keywords" ? std::string_view("names") : claim.service, claim.distance};
    }

    /// Of two poles only the one that is surest; its claim comes first.
    static void doubtOpposites(std::vector<TagClaim>& claims) {
        constexpr double kMiddle = 0.5;
        for (TagClaim& claim : claims) {
            if (!claim.level || !claims.front().level || !claim.doubt.empty()) continue;
            if ((*claim.level - kMiddle) * (*claims.front().level - kMiddle) >= 0) continue;
            claim.doubt = "the opposite is likelier";
            claim.confidence = 0;
        }
    }

    void weigh(Candidate& candidate) const {
        for (TagClaim& claim : candidate.claims) claim.confidence = claim.doubt.empty() ? weightOf(claim) : 0;
        std::stable_sort(candidate.claims.begin(), candidate.claims.end(),
                         [](const TagClaim& a, const TagClaim& b) { return a.confidence > b.confidence; });
        doubtOpposites(candidate.claims);
        std::vector<std::pair<Source, double>> sources;
        for (const TagClaim& claim : candidate.claims) {
            const auto source = std::find_if(sources.begin(), sources.end(), [&](const auto& known) {
                return known.first == sourceOf(claim);
            });
            if (source == sources.end()) {
                sources.emplace_back(sourceOf(claim), claim.confidence);
            } else {
                source->second = std::max(source->second, claim.confidence);
            }
        }
        for (const auto& [_, weight] : sources) candidate.confidence = together(candidate.confidence, weight);
        candidate.distance = candidate.claims.front().distance;
        if (candidate.tag == nullptr) {
            candidate.reason = "the taxonomy has no such tag";
        } else if (candidate.confidence == 0) {
            candidate.reason = candidate.claims.front().doubt;
        }
    }

    /// A parent that is claimed as well speaks for its child.
    void support() {
        std::vector<double> support(candidates_.size(), 0);
        for (std::size_t i = 0; i < candidates_.size(); ++i) {
            if (!isOpen(candidates_[i])) continue;
            for (const Candidate& above : candidates_) {
                const bool speaksFor = isOpen(above) && (isAncestor(*above.tag, *candidates_[i].tag) ||
                                                         isKindred(*above.tag, *candidates_[i].tag));
                if (speaksFor) support[i] = std::max(support[i], above.confidence * weights_.support);
            }
        }
        for (std::size_t i = 0; i < candidates_.size(); ++i) {
            if (support[i] > 0) candidates_[i].confidence = together(candidates_[i].confidence, support[i]);
        }
    }

    /// Whether the first is the whole of a kind that goes together with the kind of the second.
    bool isKindred(const TGRTTag& whole, const TGRTTag& tag) const {
        return isInstrument(whole) && isInstrument(tag) && !whole.parent() && tag.parent() &&
               weights_.goTogether(whole.label(), rootLabel(tag));
    }

    static bool isOpen(const Candidate& candidate) { return candidate.reason.empty(); }

    std::vector<Candidate*> surestFirst(bool (*belongs)(const TGRTTag&)) {
        std::vector<Candidate*> found;
        for (Candidate& candidate : candidates_)
            if (isOpen(candidate) && belongs(*candidate.tag)) found.push_back(&candidate);
        std::stable_sort(found.begin(), found.end(), [](const Candidate* a, const Candidate* b) {
            return a->confidence > b->confidence;
        });
        return found;
    }

    void lose(Candidate& candidate, Candidate& winner) const {
        candidate.reason = fmt::format("{} is likelier", winner.tag->label());
    }

    void decideAlternatives() {
        const std::vector<Candidate*> found = surestFirst(isAlternative);
        for (std::size_t i = 0; i < found.size(); ++i) {
            double second = 0;
            for (std::size_t j = i + 1; j < found.size() && isOpen(*found[i]); ++j) {
                if (!isOpen(*found[j]) || found[j]->tag->parent() != found[i]->tag->parent()) continue;
                second = std::max(second, found[j]->confidence);
                lose(*found[j], *found[i]);
            }
            found[i]->confidence *= 1 - weights_.contradiction * second;
        }
    }

    /// What stands nearer to the item takes from what contradicts it farther away; of a one-shot's, the
    /// surest holds, and those that are its parents or kinds of it.
    void decideInstruments(SoundKind kind) {
        std::vector<Candidate*> found = surestFirst(isInstrument);
        std::vector<double> against(found.size(), 0);
        for (std::size_t i = 0; i < found.size(); ++i) {
            for (const Candidate* other : found) {
                if (other->distance != found[i]->distance && !areRelated(*other, *found[i]) &&
                    !weights_.goTogether(rootLabel(*other->tag), rootLabel(*found[i]->tag)))
                    against[i] = std::max(against[i], other->confidence);
            }
        }
        for (std::size_t i = 0; i < found.size(); ++i)
            found[i]->confidence *= 1 - weights_.contradiction * against[i];
        if (kind != SoundKind::oneShot) return;
        found = surestFirst(isInstrument);
        std::vector<Candidate*> held;
        double second = 0;
        for (Candidate* candidate : found) {
            const bool fits = std::all_of(held.begin(), held.end(), [&](const Candidate* other) {
                return areRelated(*other, *candidate) || isKindred(*other->tag, *candidate->tag) ||
                       isKindred(*candidate->tag, *other->tag);
            });
            if (fits) {
                held.push_back(candidate);
            } else {
                second = std::max(second, candidate->confidence);
                lose(*candidate, *held.front());
            }
        }
        if (!held.empty()) held.front()->confidence *= 1 - weights_.contradiction * second / 2;
        dropWholes(held);
    }

    /// A folder of drums speaks for the bongo in it, and a bongo is no drum kit.
    void dropWholes(const std::vector<Candidate*>& held) const {
        for (Candidate* whole : held) {
            const auto part = std::find_if(held.begin(), held.end(), [&](const Candidate* other) {
                return isOpen(*other) && isKindred(*whole->tag, *other->tag);
            });
            if (part != held.end()) lose(*whole, **part);
        }
    }

    Resolution result() {
        Resolution resolution;
        for (Candidate& candidate : candidates_) {
            if (isOpen(candidate)) {
                const auto level = candidate.claims.front().level;
                resolution.held.push_back(
                    {candidate.tag, level, candidate.confidence, std::move(candidate.claims)});
            } else {
                resolution.dropped.push_back({candidate.claims.front().label, candidate.confidence,
                                              std::move(candidate.reason), std::move(candidate.claims)});
            }
        }
        addParents(resolution);
        std::stable_sort(resolution.held.begin(), resolution.held.end(),
                         [](const HeldTag& a, const HeldTag& b) {
                             return std::pair(-a.confidence, std::string_view(a.tag->label())) <
                                    std::pair(-b.confidence, std::string_view(b.tag->label()));
                         });
        return resolution;
    }

    static void addParents(Resolution& resolution) {
        std::vector<HeldTag>& held = resolution.held;
        for (std::size_t i = 0; i < held.size(); ++i) {
            const auto parent = held[i].tag->parent();
            // Of kinds of content only what the file itself says.
            if (!parent || parent->categoryIdentifier() == QVCategoryContentTypeIdentifier) continue;
            const auto known = std::find_if(held.begin(), held.end(),
                                            [&](const HeldTag& other) { return other.tag == parent; });
            const double confidence = held[i].confidence;
            if (known == held.end()) {
                held.push_back({parent, std::nullopt, confidence, {}});
            } else {
                known->confidence = std::max(known->confidence, confidence);
            }
        }
        std::erase_if(resolution.dropped, [&held](const DroppedTag& dropped) {
            return std::any_of(held.begin(), held.end(),
                               [&](const HeldTag& tag) { return tag.tag->label() == dropped.label; });
        });
    }

    const TGRTTaxonomy& taxonomy_;
    const EvidenceWeights& weights_;
    Candidates candidates_;
};

}  // namespace

std::shared_ptr<TGRTTagging> HeldTag::tagging() const {
    auto tagging = TGRTTagging::initWithTag(tag, level ? TGRTLevel::levelWithWeight(*level) : nullptr);
    if (tagging) tagging->setIsAutoTagging(true);
    return tagging;
}

ClaimResolver::ClaimResolver(std::shared_ptr<const TGRTTaxonomy> taxonomy, EvidenceWeights weights)
    : taxonomy_(std::move(taxonomy)), weights_(std::move(weights)) {}

Resolution ClaimResolver::resolve(std::vector<TagClaim> claims, SoundKind kind) const {
    return Decision(*taxonomy_, weights_).decide(std::move(claims), kind);
}

}  // namespace qvct
