#include "support/AudioFixtures.h"
#include "support/RunTool.h"

#include <algorithm>
#include <filesystem>

#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

namespace qvct::test {
namespace {

namespace fs = std::filesystem;
using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;

/// Paths of items below the folder, in the order of the answer.
std::vector<std::string> pathsIn(const json& items, const std::string& folder) {
    std::vector<std::string> paths;
    for (const json& item : items)
        paths.push_back(fs::path(item["path"].get<std::string>()).lexically_relative(folder));
    return paths;
}

/// What `read` shows of a folder and what `index` stores of it, which must be the same.
class Walks {
  public:
    explicit Walks(const std::string& folder) : read_(runTool({"read", "--json", folder})) {
        const TemporaryFolder databases;
        const std::string database = databases.path("db");
        index_ = runTool({"index", folder, "--db", database});
        found_ = runTool({"search", "--json", "--db", database, "--limit", "100", ""});
        paths_ = pathsIn(read_.json(), folder);
        auto stored = pathsIn(found_.json(), folder);
        auto sorted = paths_;
        std::sort(stored.begin(), stored.end());
        std::sort(sorted.begin(), sorted.end());
        EXPECT_EQ(stored, sorted);
        EXPECT_EQ(read_.status, index_.status);
    }

    const std::vector<std::string>& paths() const { return paths_; }
    int status() const { return read_.status; }
    /// Of both, one behind the other.
    std::vector<std::string> errors() const { return {read_.errors, index_.errors}; }

  private:
    ToolResult read_;
    ToolResult index_;
    ToolResult found_;
    std::vector<std::string> paths_;
};

void makeSocket(const std::string& path) {
    const int socket = ::socket(AF_UNIX, SOCK_STREAM, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    ASSERT_LT(path.size(), sizeof address.sun_path);
    path.copy(address.sun_path, path.size());
    ASSERT_EQ(::bind(socket, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
    ::close(socket);
}

TEST(Walk, TakesFilesAndBundlesAndNothingElse) {
    const TemporaryFolder folder;
    const std::string sound = Wav().file(Wav().format() + Wav().data());
    for (const char* name :
         {"b/z.wav", "a.wav", "c.wav", "b/.hidden.wav", ".hidden/x.wav", "folder.wav/in.wav",
          "one.patch/in.wav", "notes.txt", "d.cst", "d.cst.caf", "._a.wav", "E.AIFF"})
        folder.write(name, sound);
    folder.write("file.patch", "no bundle");
    ASSERT_EQ(::mkfifo(folder.path("pipe.wav").c_str(), 0600), 0);
    ASSERT_NO_FATAL_FAILURE(makeSocket(folder.path("socket.wav")));
    fs::create_symlink("/dev/null", folder.path("device.wav"));
    fs::create_symlink("a.wav", folder.path("link.wav"));
    fs::create_directory_symlink(folder.path(), folder.path("b/circle"));
    const Walks walks(folder.path());
    EXPECT_EQ(walks.status(), 0) << walks.errors()[0] << walks.errors()[1];
    // A folder's items come before what lies in its folders.
    EXPECT_THAT(walks.paths(), ElementsAre("E.AIFF", "a.wav", "c.wav", "d.cst", "link.wav", "one.patch",
                                           "b/z.wav", "folder.wav/in.wav"));
    const ToolResult named = runTool({"read", folder.path("pipe.wav")});
    EXPECT_EQ(named.status, 1);
    EXPECT_THAT(named.errors, HasSubstr("pipe.wav: neither a file nor a folder"));
}

TEST(Walk, TellsOfWhatCannotBeListed) {
    const TemporaryFolder folder;
    const std::string sound = Wav().file(Wav().format() + Wav().data());
    folder.write("a.wav", sound);
    fs::create_symlink("nowhere", folder.path("gone.wav"));
    fs::create_symlink("nowhere", folder.path("not content"));
    const std::string name(200, 'd');
    int parent = ::open(folder.path().c_str(), O_RDONLY | O_DIRECTORY);
    for (int depth = 0; depth < 25; ++depth) {  // longer than a path may be
        ASSERT_EQ(::mkdirat(parent, name.c_str(), 0700), 0);
        const int child = ::openat(parent, name.c_str(), O_RDONLY | O_DIRECTORY);
        ::close(parent);
        parent = child;
    }
    ::close(parent);
    const Walks walks(folder.path());
    EXPECT_EQ(walks.status(), 1);
    EXPECT_THAT(walks.paths(), ElementsAre("a.wav"));
    for (const std::string& errors : walks.errors()) {
        EXPECT_THAT(errors, HasSubstr("gone.wav: No such file or directory"));
        EXPECT_THAT(errors, HasSubstr("File name too long"));
        EXPECT_EQ(std::count(errors.begin(), errors.end(), '\n'), 2) << errors;
    }
}

}  // namespace
}  // namespace qvct::test
