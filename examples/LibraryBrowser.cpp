// A host in miniature: indexes a folder of sounds with a describer of its own, then answers queries.
//
//   example_library_browser FOLDER DATABASE [QUERY]

#include "contentdb/ContentDatabase.h"
#include "platform/Url.h"

#include <iostream>

namespace {

using namespace qvct;
using namespace qvct::contentdb;

/// What this host knows of a file: its name, and a tag for the folder that it lies in.
class FolderDescriber : public ItemDescriber {
  public:
    std::optional<IndexedItem> describe(const std::string& path, Error* /*error*/) override {
        const URL url = URL::fileURLWithPath(path);
        IndexedItem item;
        item.name = url.lastPathComponentWithoutExtension();
        IndexedTagging tagging;
        tagging.label = url.URLByDeletingLastPathComponent().lastPathComponent();
        tagging.category = "Folder";
        item.taggings.push_back(tagging);
        return item;
    }
};

int fail(const std::string& message) {
    std::cerr << message << '\n';
    return 1;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc < 3) return fail("usage: example_library_browser FOLDER DATABASE [QUERY]");
    Error error;
    IndexOptions options;
    options.folders = {argv[1]};
    options.database = argv[2];
    const auto run = indexLibrary(
        options, [] { return std::make_unique<FolderDescriber>(); }, &error);
    if (!run) return fail(error.message);
    std::cout << run->described << " read, " << run->unchanged << " unchanged\n";

    const auto database = ContentDatabase::open(options.database, &error);
    const auto vocabulary = database ? database->vocabulary(&error) : std::nullopt;
    if (!vocabulary) return fail(error.message);
    QueryError fault;
    const auto query = parseQuery(argc > 3 ? argv[3] : "", *vocabulary, &fault);
    if (!query) return fail(fault.message);
    const auto found = database->search(*query, 20, &error);
    if (!found) return fail(error.message);
    for (const Found& one : *found) std::cout << one.item.path << '\n';
    return 0;
}
