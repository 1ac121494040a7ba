#include "Library.h"
#include "contentdb/store/IdSet.h"

#include <filesystem>
#include <functional>
#include <set>

#include <fmt/format.h>
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace qvct::test {
namespace {

using namespace contentdb;
using testing::ElementsAre;
using testing::HasSubstr;

std::vector<std::string> foundNames(const std::string& path, const std::string& text) {
    const auto database = ContentDatabase::open(path);
    std::vector<std::string> names;
    const auto all = database->search(*parseQuery(text, *database->vocabulary(), nullptr), 1000);
    for (const Found& found : *all) names.push_back(found.item.name);
    return names;
}

TEST(Store, KeepsEveryByteOfAnItem) {
    const TemporaryFolder folder;
    const std::vector<IndexedItem> items = generatedItems(3, 500);
    store(folder.path("db"), items);
    const auto database = ContentDatabase::open(folder.path("db"));
    for (const IndexedItem& item : items) {
        const auto found = database->item(item.path);
        ASSERT_TRUE(found);
        EXPECT_EQ(found->item, item);
    }
    Error error;
    EXPECT_TRUE(database->check(&error)) << error.message();
    const std::vector<std::string> categories = database->vocabulary()->categories;
    EXPECT_THAT(categories, testing::IsSupersetOf({"Artist", "Genres", "Rhythm"}));
    EXPECT_EQ(std::set(categories.begin(), categories.end()).size(), categories.size());
    EXPECT_THAT(database->vocabulary()->numbers, testing::Contains("Gain"));
}

TEST(Store, FindsAnItemByItsNewFactsOnlyAndInOnePlace) {
    const TemporaryFolder folder;
    const std::string path = folder.path("db");
    std::vector<IndexedItem> items = generatedItems(4, 50);
    items[20].name = "Oldname";
    store(path, items);
    items[20].name = "Newname";
    items[20].taggings = {{"Polka", "Genres", {}, 0.25F, Provenance::stored, {}}};
    change(path, [&](StoreWriter& writer) {
        writer.put(21, items[20], termsOf(items[20]));
        writer.put(51, items[3], termsOf(items[3]));  // which is item 4 so far
        writer.remove(1);
    });
    EXPECT_THAT(foundNames(path, "oldname"), testing::IsEmpty());
    EXPECT_THAT(foundNames(path, "newname genre:polka level:polka=0.25"), ElementsAre("Newname"));
    EXPECT_EQ(foundNames(path, "").size(), 49U);
    EXPECT_TRUE(ContentDatabase::open(path)->check());
}

TEST(Store, IsNotThereBeforeTheBatchIsWhole) {
    const TemporaryFolder folder;
    const std::string path = folder.path("db");
    store(path, generatedItems(4, 10));
    const auto removeAll = [](StoreWriter& writer) {
        for (ItemId id = 1; id <= 10; ++id) writer.remove(id);
    };
    change(path, removeAll, false);
    EXPECT_EQ(foundNames(path, "").size(), 10U);
}

/// What `work` answers in a process of a user who may write nowhere here.
std::string asStranger(const std::function<std::string()>& work) {
    int ends[2];
    EXPECT_EQ(::pipe(ends), 0);
    const pid_t child = ::fork();
    if (child == 0) {
        constexpr unsigned nobody = 65534;
        const bool isStranger = ::setgid(nobody) == 0 && ::setuid(nobody) == 0;
        const std::string answer = isStranger ? work() : "cannot become another";
        ::_exit(::write(ends[1], answer.data(), answer.size()) > 0 ? 0 : 1);
    }
    ::close(ends[1]);
    std::string answer(4096, '\0');
    answer.resize(
        static_cast<std::size_t>(std::max<ssize_t>(0, ::read(ends[0], answer.data(), answer.size()))));
    ::close(ends[0]);
    ::waitpid(child, nullptr, 0);
    return answer;
}

TEST(Store, IsReadByOneWhoMayNotWriteThere) {
    if (::geteuid() != 0) GTEST_SKIP() << "only root can become another user";
    const TemporaryFolder folder;
    const std::string path = folder.path("read-only/db");
    std::filesystem::create_directory(folder.path("read-only"));
    store(path, generatedItems(4, 10));
    for (const std::string& each : {folder.path(), folder.path("read-only")})
        std::filesystem::permissions(each, std::filesystem::perms(0555));
    const auto count = [&path] {
        Error error;
        const auto database = ContentDatabase::open(path, &error);
        const auto totals = database ? database->totals(&error) : std::nullopt;
        return totals && database->check(&error) ? std::to_string(totals->items) : error.message();
    };
    EXPECT_EQ(asStranger(count), "10");
    // What is only in the log is not passed over.
    {
        const auto writing = openDatabase(path, Access::write);
        writing->run("INSERT INTO setting VALUES ('other', 1)");
        std::filesystem::copy(path, path + "2");
        std::filesystem::copy(path + "-wal", path + "2-wal");
    }
    for (const char* part : {"", "-wal"}) std::filesystem::rename(path + "2" + part, path + part);
    EXPECT_THAT(asStranger(count), HasSubstr("its latest changes are only in the log beside it"));
    EXPECT_EQ(count(), "10");
    Connection(path, Connection::Mode::readWrite).run("PRAGMA user_version = 99");
    EXPECT_THAT(asStranger(count), HasSubstr("newer version"));
}

TEST(Store, RefusesWhatIsNoContentDatabaseOfThisVersion) {
    const TemporaryFolder folder;
    const std::string newer = folder.path("newer");
    store(newer, {});
    Connection(newer, Connection::Mode::readWrite).run("PRAGMA user_version = 99");
    folder.write("song.wav", std::string(5000, 'x'));
    const std::string empty = folder.write("empty", "");
    const std::string pipe = folder.path("pipe");
    ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
    struct Case {
        std::string path;
        std::string reason;
    };
    for (const Case& one :
         {Case{newer, "newer version"}, Case{folder.path("song.wav"), "not a content database"},
          Case{empty, "not a content database"}, Case{folder.path("none"), "no such database"},
          Case{folder.path(), "a folder"}, Case{pipe, "a pipe or device"},
          Case{"/dev/null", "a pipe or device"}}) {
        Error error;
        EXPECT_EQ(ContentDatabase::open(one.path, &error), nullptr) << one.path;
        EXPECT_THAT(error.message(), HasSubstr(one.reason));
        EXPECT_THAT(error.message(), HasSubstr(one.path));
    }
}

TEST(Store, ReadsNoRecordThatEndsTooEarlyOrTooLate) {
    const std::vector<IndexedItem> items = generatedItems(4, 1);
    for (const char* damaged :
         {"substr(description, 1, length(description) - 1)", "CAST(description || 'x' AS BLOB)",
          "CAST(description || CAST(x'0178' AS TEXT) || 'x' AS BLOB)"}) {
        const TemporaryFolder folder;
        store(folder.path("db"), items);
        Connection(folder.path("db"), Connection::Mode::readWrite)
            .run(fmt::format("UPDATE item SET description = {}", damaged).c_str());
        Error error;
        EXPECT_FALSE(ContentDatabase::open(folder.path("db"))->item(items[0].path, &error)) << damaged;
        EXPECT_THAT(error.message(), HasSubstr("the record of " + items[0].path));
    }
}

TEST(IdSet, ComesBackFromEitherForm) {
    for (const std::uint32_t count : {0U, 1U, 4095U, 4096U, 4097U, 65536U}) {
        IdSet set;
        for (std::uint32_t i = 0; i < count; ++i) set.insert(static_cast<std::uint16_t>(i * 7919U));
        EXPECT_EQ(set.count(), count);
        IdSet back;
        EXPECT_TRUE(back.insertEncoded(set.encoded()));
        EXPECT_EQ(back, set);
    }
    IdSet set;
    EXPECT_FALSE(set.insertEncoded("abc"));
    EXPECT_FALSE(set.insertEncoded(std::string(8194, 'x')));
}

}  // namespace
}  // namespace qvct::test
