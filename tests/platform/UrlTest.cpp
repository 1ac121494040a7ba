#include "platform/text/Url.h"

#include <gtest/gtest.h>

namespace qvct {
namespace {

TEST(Url, KeepsEveryByteOfAPathThroughItsStringForm) {
    for (const char* path : {"/Loops/100% Funk #3.wav",
                             "/L\xc3\xb6"
                             "ops/\xe9\x9f\xb3.aif",
                             "/bad\xff\xfe name.caf", "/a b?c"}) {
        const URL url = URL::fileURLWithPath(path);
        EXPECT_EQ(url.path(), path);
        EXPECT_EQ(URL::URLWithString(url.absoluteString()).path(), path);
        EXPECT_EQ(url.decodedString(), std::string("file://") + path);
    }
    EXPECT_EQ(URL::URLWithString("file:///%c3%B6%4a%zz%4").path(), "/\xc3\xb6J%zz%4");
}

TEST(Url, FindsComponentsAndExtensions) {
    struct {
        const char *path, *last, *extension, *stem, *parent;
    } const cases[] = {
        {"/a/Warm Pad.patch", "Warm Pad.patch", "patch", "Warm Pad", "/a"},
        {"/a/Warm Pad.patch/", "Warm Pad.patch", "patch", "Warm Pad", "/a"},
        {"/a/.hidden", ".hidden", "", ".hidden", "/a"},
        {"/a.b/name", "name", "", "name", "/a.b"},
        {"/Bass.cst.plist", "Bass.cst.plist", "plist", "Bass.cst", "/"},
        {"/x/../y//z.", "z.", "", "z", "/y"},
        {"/", "/", "", "/", "/"},
    };
    for (const auto& c : cases) {
        const URL url = URL::fileURLWithPath(c.path);
        EXPECT_EQ(url.lastPathComponent(), c.last) << c.path;
        EXPECT_EQ(url.pathExtension(), c.extension) << c.path;
        EXPECT_EQ(url.lastPathComponentWithoutExtension(), c.stem) << c.path;
        EXPECT_EQ(url.URLByDeletingLastPathComponent().path(), c.parent) << c.path;
    }
}

TEST(Url, OtherSchemesAreNoFileUrls) {
    const URL url = URL::URLWithString("https://host.example/a%20b/c.caf?q");
    EXPECT_FALSE(url.isFileURL());
    EXPECT_EQ(url.absoluteString(), "https://host.example/a%20b/c.caf?q");
}

}  // namespace
}  // namespace qvct
