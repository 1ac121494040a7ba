// A host in miniature: tags the items of a folder, stores one tag, indexes the folder and answers a query.
//
//   host FOLDER DATABASE QUERY

#include <iostream>

#include <qvcontenttagging/ContentDatabase.h>
#include <qvcontenttagging/ContentWalk.h>
#include <qvcontenttagging/Indexer.h>
#include <qvcontenttagging/QVTaggingAggregator.h>
#include <qvcontenttagging/TGRTMetaDataReaderFactory.h>
#include <qvcontenttagging/TGRTMetaDataWriterFactory.h>
#include <qvcontenttagging/TGRTTaxonomy.h>
#include <qvcontenttagging/Version.h>

namespace {

using namespace qvct;
using namespace qvct::contentdb;

int fail(const std::string& message) {
    std::cerr << "host: " << message << '\n';
    return 1;
}

/// Adds a tag to what the item stores already.
bool store(const std::shared_ptr<TGRTTag>& tag, const URL& url, Error& error) {
    const auto reader = TGRTMetaDataReaderFactory::metaDataReaderForURL(url);
    const auto writer = TGRTMetaDataWriterFactory::taggingWriterForURL(url);
    if (!reader || !writer) return qvct::fail(&error, kErrorInvalidArgument, "no content", {url.path()});
    const auto record = reader->readMetaDataFromURL(url, 0, &error);
    ObjectSet<TGRTTagging> taggings = record ? record->taggings() : ObjectSet<TGRTTagging>{};
    taggings.insert(TGRTTagging::initWithTag(tag, nullptr));
    return writer->writeTaggings(taggings, url, &error);
}

bool tagAll(const std::string& folder, const TGRTTaxonomy& taxonomy, Error& error) {
    const auto aggregator = QVTaggingAggregator::defaultTaggingAggregator();
    bool isDone = true;
    walkContent(
        folder,
        [&](const URL& url) {
            std::cout << url.lastPathComponent() << ':';
            for (const auto& tagging :
                 aggregator->taggingsWithContentsOfURL(url, taxonomy, QVCTAutoTaggingOptionFilenameKeywords))
                std::cout << ' ' << tagging->label();
            std::cout << '\n';
            isDone = store(taxonomy.findTagForLabel("Cinematic", "Genres"), url, error) && isDone;
            return true;
        },
        [&](const Error& failure) {
            error = failure;
            isDone = false;
        });
    return isDone;
}

bool search(const std::string& path, const std::string& text, Error& error) {
    const auto database = ContentDatabase::open(path, &error);
    const auto vocabulary = database ? database->vocabulary(&error) : std::nullopt;
    if (!vocabulary) return false;
    QueryError fault;
    const auto query = parseQuery(text, *vocabulary, &fault);
    if (!query) return qvct::fail(&error, kErrorInvalidArgument, fault.message);
    const auto found = database->search(*query, 20, &error);
    if (!found) return false;
    for (const Found& one : *found) {
        std::cout << "found " << one.item.name << ':';
        for (const IndexedTagging& tagging : one.item.taggings) std::cout << ' ' << tagging.label;
        std::cout << '\n';
    }
    return true;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 4) return fail("usage: host FOLDER DATABASE QUERY");
    std::cout << "QVContentTagging " << version() << '\n';

    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    std::cout << taxonomy->categories().size() << " categories, " << taxonomy->allTags().size() << " tags\n";

    Error error;
    if (!tagAll(argv[1], *taxonomy, error)) return fail(error.message());

    IndexOptions options;
    options.folders = {argv[1]};
    options.database = argv[2];
    const auto run = indexLibrary(options, &error);
    if (!run) return fail(error.message());
    std::cout << run->described << " read, " << run->failed << " failed\n";

    if (!search(argv[2], argv[3], error)) return fail(error.message());
    return 0;
}
