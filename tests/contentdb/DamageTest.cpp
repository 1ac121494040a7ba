#include "Library.h"
#include "support/RunTool.h"

#include <filesystem>
#include <random>

#include <fmt/format.h>
#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using namespace contentdb;

/// What a host gets from a database: everything that searches answer, or "refused".
std::string answers(const std::string& path) {
    const auto database = ContentDatabase::open(path);
    if (!database) return "refused";
    const auto vocabulary = database->vocabulary();
    if (!vocabulary) return "refused";
    std::string result;
    for (const char* text :
         {"kick", "tag:House", "bpm:90..120 loop", "level:\"Bright / Dark\">0.2", "-type:loop"}) {
        const auto query = parseQuery(text, *vocabulary, nullptr);
        const auto found = database->search(*query, 20);
        const auto count = database->count(*query);
        const auto facets = database->facets(*query);
        if (!found || !count || !facets) return "refused";
        for (const Found& one : *found) result += one.item.path + "\n";
        for (const Facet& facet : *facets) result += fmt::format("{} {}\n", facet.label, facet.count);
        result += std::to_string(*count) + "\n";
    }
    return result;
}

TEST(Damage, IsRefusedOrWithoutConsequence) {
    const TemporaryFolder folder;
    const std::string intact = folder.path("intact");
    store(intact, generatedItems(6, 300));
    const std::string bytes = readAll(intact);
    const std::string right = answers(intact);
    ASSERT_GT(right.size(), 1000U);
    const auto isRefused = [&](const std::string& broken, const std::string& what) {
        const std::string path = folder.write("broken", broken);
        const std::string answer = answers(path);
        EXPECT_TRUE(answer == "refused" || answer == right) << what;
        // What no search has read, the check finds.
        const auto database = ContentDatabase::open(path);
        EXPECT_FALSE(database != nullptr && database->check()) << what;
        for (const char* rest : {"-wal", "-shm"}) std::filesystem::remove(path + rest);
        return answer == "refused";
    };
    std::mt19937 random(1);
    int refused = 0;
    for (int i = 0; i < 1000; ++i) {
        std::string broken = bytes;
        const std::size_t at = std::uniform_int_distribution<std::size_t>(0, bytes.size() - 1)(random);
        broken[at] = static_cast<char>(broken[at] ^ static_cast<char>(1U << random() % 8));
        refused += isRefused(broken, "bit flipped in byte " + std::to_string(at)) ? 1 : 0;
    }
    EXPECT_GT(refused, 300);
    for (const double share : {0.001, 0.1, 0.5, 0.77, 0.999}) {
        const auto size = static_cast<std::size_t>(static_cast<double>(bytes.size()) * share);
        isRefused(bytes.substr(0, size), "cut off at byte " + std::to_string(size));
    }
}

}  // namespace
}  // namespace qvct::test
