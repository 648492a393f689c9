#include "orv/detail/assetpath.h"

#include "orv/memorystreamsource.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

using namespace orv;
using support::LogCapture;

namespace
{

/// Has every name and opens none.
class BrokenSource : public StreamSource
{
public:
    bool exists(const char*) const override { return true; }
    SharedPtr<Stream> open(const char*, bool) override { return {}; }
    const char* getName() const override { return "broken"; }
};

SharedPtr<MemoryStreamSource> makeSource(const char* name, const char* content)
{
    const auto source = makeShared<MemoryStreamSource>();
    source->add(name, makeShared<MemoryStream>(content, int(std::char_traits<char>::length(content))));
    return source;
}

} // namespace

TEST(AssetName, deprecatedNamespaces)
{
    const struct
    {
        const char* name;
        const char* normalized;
        const char* warned; ///< the namespace; null for no warning
    } cases[] = {{"orv:white.png", "orv#white.png", "orv"},
                 {"luvane:blur.sp", "luvane#blur.sp", "luvane"},
                 {"orv:a:b", "orv#a:b", "orv"},
                 {"orv#white.png", "orv#white.png", nullptr},
                 {"orvx:name", "orvx:name", nullptr},
                 {"xorv:name", "xorv:name", nullptr},
                 {nullptr, "", nullptr}};
    for (const auto& test : cases)
    {
        LogCapture log;
        EXPECT_EQ(test.normalized, detail::normalizeAssetName(test.name));
        const std::string space = test.warned ? test.warned : "";
        EXPECT_EQ(test.warned ? 1 : 0, log.count('W')) << test.normalized;
        EXPECT_EQ(test.warned ? 1 : 0,
                  log.countMessage("Use of \"" + space +
                                   ":\" to indicate asset namespace is deprecated; use \"" + space +
                                   "#\" instead."));
    }
}

// Fault caught: sources searched in another order, or on after the first one that has the name.
TEST(AssetPath, firstSourceThatHasTheNameDecides)
{
    detail::AssetPath path;
    path.add(makeSource("b", "one"));
    path.add(makeSource("a", "second"));
    path.add(makeSource("a", "third one"));
    const SharedPtr<Stream> found = path.find("a");
    ASSERT_TRUE(found);
    EXPECT_EQ(6, found->size());
    EXPECT_FALSE(path.find("c"));
    EXPECT_FALSE(path.find(nullptr));

    detail::AssetPath broken;
    broken.add(makeShared<BrokenSource>());
    broken.add(makeSource("a", "x"));
    EXPECT_FALSE(broken.find("a"));

    EXPECT_FALSE(broken.remove("no such source"));
    EXPECT_TRUE(broken.remove("broken"));
    EXPECT_TRUE(broken.find("a"));
}

// Fault caught: a null pointer called, or one that hides the sources behind it.
TEST(AssetPath, emptySourceIsLoggedAndSkipped)
{
    detail::AssetPath path;
    EXPECT_TRUE(path.add(SharedPtr<StreamSource>()));
    path.add(makeSource("a", "x"));

    LogCapture log;
    EXPECT_TRUE(path.find("a"));
    EXPECT_EQ(1, log.countMessage("Error: pointer operator on null. class: StreamSource"));
    EXPECT_TRUE(path.remove("MemoryStreamSource"));
    EXPECT_EQ(2, log.countMessage("Error: pointer operator on null. class: StreamSource"));

    log.clear();
    EXPECT_FALSE(detail::AssetPath().add("somewhere", true));
    EXPECT_EQ(1, log.count('I'));
}
