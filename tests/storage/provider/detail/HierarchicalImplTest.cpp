#include <storage/provider/detail/HierarchicalImpl.hpp>

#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include <tests/support/inThreads.hpp>
#include <tests/support/thrown.hpp>

namespace foundation::storage::provider::detail {
namespace {

using network::IRI;
using network::IRIArgs;
using tests::support::internalTextOf;
using tests::support::inThreads;

HierarchicalImpl const& made(std::vector<std::unique_ptr<HierarchicalImpl>>& keep, std::u16string const& text)
{
    return *keep.emplace_back(std::make_unique<HierarchicalImpl>(IRI(text)));
}

/// Counts the calls of the operations that others rest on.
class Counting : public HierarchicalImpl
{
public:
    using HierarchicalImpl::HierarchicalImpl;

    IRI toIRI() const override
    {
        ++iris;
        return HierarchicalImpl::toIRI();
    }

    std::u16string const& getPath() const override
    {
        ++paths;
        return HierarchicalImpl::getPath();
    }

    std::shared_ptr<StorageIRIImpl> withPath(std::u16string const& path) const override
    {
        ++relatives;
        return HierarchicalImpl::withPath(path);
    }

    mutable std::atomic<int> iris{0};
    mutable std::atomic<int> paths{0};
    mutable std::atomic<int> relatives{0};
};

/// The record of an IRI that cannot be: a relative path behind an authority.
IRIArgs impossibleRecord()
{
    IRIArgs args{IRI(u"s://h")};
    args.path = L"relative";
    args.hasPath = true;
    return args;
}

struct Row
{
    std::u16string text;
    std::u16string canonical;
    std::u16string path;
    std::u16string name;
    std::u16string host;
    bool hasParent;
};

TEST(HierarchicalImpl, AnswersFromItsIri)
{
    for (Row const& row : std::vector<Row>{
             {u"s://h/a/b", u"s://h/a/b", u"/a/b", u"b", u"h", true},
             {u"s://h/a/b/", u"s://h/a/b", u"/a/b", u"b", u"h", true},
             {u"s://h//", u"s://h/", u"/", u"/", u"h", false},
             {u"s://h/", u"s://h/", u"/", u"/", u"h", false},
             {u"s://h", u"s://h", u"", u"", u"h", true},
             {u"s:///a", u"s:///a", u"/a", u"a", u"", true},
             {u"s:/a", u"s:/a", u"/a", u"a", u"", true},
             {u"S://H/A", u"S://H/A", u"/A", u"A", u"H", true},
             {u"s://h/a//b", u"s://h/a//b", u"/a//b", u"b", u"h", true},
             {u"s://h/a/../b", u"s://h/a/../b", u"/a/../b", u"b", u"h", true},
             {u"s://u:p@h:8/a%20b", u"s://u:p@h:8/a%20b", u"/a b", u"a b", u"h", true},
             {u"s://h%C3%A9/%FF%e4%bd%a0", u"s://h%C3%A9/%FF%e4%bd%a0", u"/%FF\u4F60", u"%FF\u4F60", u"h\u00E9", true},
             {u"s://h/a%2Fb", u"s://h/a%2Fb", u"/a/b", u"b", u"h", true},
             {u"s://h/a%2F", u"s://h/a%2F", u"/a/", u"a", u"h", true},
             {u"s://h/a/?q/#f/", u"s://h/a?q/#f/", u"/a", u"a", u"h", true},
         })
    {
        SCOPED_TRACE(testing::PrintToString(row.text));
        HierarchicalImpl const location{IRI(row.text)};
        EXPECT_EQ(location.getScheme(), row.text.substr(0, 1));
        EXPECT_EQ(location.toString(), row.canonical);
        EXPECT_EQ(location.toIRI().toString(), row.canonical);
        EXPECT_EQ(location.getPath(), row.path);
        EXPECT_EQ(location.hasPath(), !row.path.empty());
        EXPECT_EQ(location.getName(), row.name);
        EXPECT_EQ(location.getHost(), row.host);
        EXPECT_EQ(location.hasHost(), !row.host.empty());
        EXPECT_EQ(location.hasParent(), row.hasParent);
        EXPECT_FALSE(location.isOpaque());
        EXPECT_FALSE(location.hasInnerIRI());
    }
}

TEST(HierarchicalImpl, RefusesAnIriThatIsNotAbsolute)
{
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { HierarchicalImpl{IRI(u"rel/a")}; }),
              u"IRI 'rel/a' is not absolute.");
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { HierarchicalImpl{IRI(u"rel/a/")}; }),
              u"IRI 'rel/a/' is not absolute.");
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { HierarchicalImpl{IRI(u"//h/\u00E9")}; }),
              u"IRI '//h/\u00E9' is not absolute.");
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { HierarchicalImpl{IRI(u"")}; }), u"IRI '' is not absolute.");
}

TEST(HierarchicalImpl, HasNoInnerLocation)
{
    HierarchicalImpl const location{IRI(u"s://h/a")};
    EXPECT_EQ(internalTextOf<std::logic_error>([&] { static_cast<void>(location.getInnerIRI()); }),
              u"IRI does not have an inner IRI.");
}

IRIArgs pathAlone(std::wstring const& path)
{
    IRIArgs args;
    args.path = path;
    args.hasPath = true;
    return args;
}

TEST(HierarchicalImpl, SplitsAnyPathIntoFolderAndName)
{
    struct Split
    {
        std::wstring path;
        std::u16string parent;
        std::u16string name;
    };
    for (auto const& [path, parent, name] : std::vector<Split>{
             {L"/a/b/c", u"/a/b", u"c"},
             {L"/a", u"/", u"a"},
             {L"/a/b/", u"/a", u"b"},
             {L"a/b", u"a", u"b"},
             {L"a/b/", u"a", u"b"},
             {L"/a//b", u"/a/", u"b"},
             {L"/a//", u"/a", u""},
             {L"//", u"/", u""},
             {L"//a", u"/", u"a"},
         })
    {
        HierarchicalImpl const location(pathAlone(path));
        EXPECT_EQ(location.getParent()->getPath(), parent);
        EXPECT_EQ(location.getName(), name);
    }
}

TEST(HierarchicalImpl, PathWithoutAFolderHasANameAlone)
{
    for (auto const& [path, name] :
         std::vector<std::pair<std::wstring, std::u16string>>{{L"a", u"a"}, {L"a/", u"a"}, {L"", u""}, {L"/", u"/"}})
    {
        HierarchicalImpl const location(pathAlone(path));
        EXPECT_EQ(location.getName(), name);
        EXPECT_EQ(internalTextOf<std::logic_error>([&] { static_cast<void>(location.getParent()); }),
                  u"IRI does not have a parent IRI.");
        EXPECT_EQ(location.getName(), name);
    }
}

TEST(HierarchicalImpl, ParentIsTheFolderAround)
{
    for (auto const& [text, parent] : std::vector<std::pair<std::u16string, std::u16string>>{
             {u"s://h/a/b", u"s://h/a"},
             {u"s://h/a", u"s://h/"},
             {u"s://h/a//b", u"s://h/a/"},
             {u"s:/a", u"s:/"},
             {u"s:///a/b", u"s:///a"},
             {u"s://u@h:8/a/b", u"s://u@h:8/a"},
             {u"s://h/a b/c", u"s://h/a%20b"},
             {u"s://h/a?q#f", u"s://h/?q#f"},
             {u"s://[fe80::1%25eth0]/a", u"s://[fe80::1%25eth0]/"},
         })
    {
        HierarchicalImpl const location{IRI(text)};
        EXPECT_EQ(location.getParent()->toString(), parent);
        EXPECT_EQ(&location.getParent(), &location.getParent());
    }
}

TEST(HierarchicalImpl, TopHasNoParent)
{
    for (std::u16string const text : {u"s://h/", u"s://h", u"s:/", u"s:"}) {
        HierarchicalImpl const location{IRI(text)};
        for (int attempt = 0; attempt != 2; ++attempt)
            EXPECT_EQ(internalTextOf<std::logic_error>([&] { static_cast<void>(location.getParent()); }),
                      u"IRI does not have a parent IRI.");
    }
}

TEST(HierarchicalImpl, RootHasTheRootPath)
{
    HierarchicalImpl const location{IRI(u"s://h/a/b")};
    EXPECT_EQ(location.getRoot()->toString(), u"s://h/");
    EXPECT_EQ(location.getRoot()->getPath(), u"/");
    EXPECT_EQ(location.getRoot(), location.getRoot());
    EXPECT_TRUE(location.getRoot()->equals(*HierarchicalImpl(IRI(u"s://h/c")).getParent()));
}

TEST(HierarchicalImpl, WithPathKeepsEverythingElse)
{
    HierarchicalImpl const location{IRI(u"s://u:p@h:8/a?q#f")};
    auto const other = location.withPath(u"/x y/\U0001F600");
    EXPECT_EQ(other->toString(), u"s://u:p@h:8/x%20y/\U0001F600?q#f");
    EXPECT_EQ(other->getPath(), u"/x y/\U0001F600");
    EXPECT_EQ(other.use_count(), 1);
}

TEST(HierarchicalImpl, WithPathKeepsATrailingSlash)
{
    auto const other = HierarchicalImpl(IRI(u"s://h/a")).withPath(u"/x/");
    EXPECT_EQ(other->getPath(), u"/x/");
    EXPECT_EQ(other->toString(), u"s://h/x/");
    EXPECT_EQ(other->getName(), u"x");
    EXPECT_EQ(other->getParent()->getPath(), u"/");
}

TEST(HierarchicalImpl, WithPathTakesPlainText)
{
    HierarchicalImpl const location{IRI(u"s:/a")};
    EXPECT_EQ(location.withPath(u"/%41?#")->toString(), u"s:/%2541%3F%23");
    EXPECT_EQ(location.withPath(u"//a")->toString(), u"s:/%2Fa");
    EXPECT_EQ(location.withPath(u"//a")->getPath(), u"//a");
    IRIArgs args{IRI(u"s://h/a")};
    args.pathIsEncoded = true;
    EXPECT_EQ(HierarchicalImpl(args).withPath(u"/%41")->toString(), u"s://h/%2541");
}

TEST(HierarchicalImpl, WithPathRefusesALoneSurrogate)
{
    HierarchicalImpl const location{IRI(u"s:/a")};
    EXPECT_THROW(static_cast<void>(location.withPath(std::u16string{u'/', char16_t{0xD800}})), std::out_of_range);
}

TEST(HierarchicalImpl, LeadsToAFilePath)
{
    using fl::filesystem::upath;
    EXPECT_EQ(HierarchicalImpl(IRI(u"file:///tmp/a%20b")).toUPath().string(), u"/tmp/a b");
    EXPECT_EQ(HierarchicalImpl(IRI(u"s://h//a//b")).toUPath().string(), u"//a//b");
    EXPECT_EQ(HierarchicalImpl(IRI(u"s://h")).toUPath(), upath());
}

TEST(HierarchicalImpl, ComparesTexts)
{
    std::vector<std::unique_ptr<HierarchicalImpl>> keep;
    EXPECT_TRUE(made(keep, u"s://h/a/").equals(made(keep, u"s://h/a")));
    EXPECT_FALSE(made(keep, u"s://h/a").equals(made(keep, u"S://h/a")));
    EXPECT_FALSE(made(keep, u"s://h/a").equals(made(keep, u"s://H/a")));
    EXPECT_FALSE(made(keep, u"s://h/%41").equals(made(keep, u"s://h/A")));
    EXPECT_FALSE(made(keep, u"s://h/a").equals(made(keep, u"s://h//a")));
    EXPECT_FALSE(made(keep, u"s:/a").equals(made(keep, u"s:///a")));
    EXPECT_TRUE(made(keep, u"s://h/a").less(made(keep, u"s://h/b")));
    EXPECT_TRUE(made(keep, u"s://h").less(made(keep, u"s://h/")));
}

TEST(HierarchicalImpl, RecordIsTakenAsItIs)
{
    IRIArgs args{IRI(u"s://h/a/")};
    EXPECT_EQ(HierarchicalImpl(args).toString(), u"s://h/a/");
    args.hasScheme = false;
    EXPECT_EQ(HierarchicalImpl(args).toString(), u"//h/a/");
}

TEST(HierarchicalImpl, RecordIsNotLookedAtBeforeItIsNeeded)
{
    HierarchicalImpl const location(impossibleRecord());
    EXPECT_FALSE(location.isOpaque());
    for (int attempt = 0; attempt != 2; ++attempt) {
        EXPECT_THROW(static_cast<void>(location.toString()), std::invalid_argument);
        EXPECT_THROW(static_cast<void>(location.getPath()), std::invalid_argument);
        EXPECT_THROW(static_cast<void>(location.getParent()), std::invalid_argument);
    }
    EXPECT_EQ(location.getRoot()->toString(), u"s://h/");
}

TEST(HierarchicalImpl, RelativeIsNotLookedAtBeforeItIsNeeded)
{
    auto const relative = HierarchicalImpl(IRI(u"s://h/a")).withPath(u"relative");
    EXPECT_THROW(static_cast<void>(relative->getName()), std::invalid_argument);
    EXPECT_EQ(relative->withPath(u"/b")->toString(), u"s://h/b");
}

TEST(HierarchicalImpl, KeepsWhatItComputed)
{
    Counting const location{IRI(u"s://h/a/b")};
    for (int i = 0; i != 2; ++i) {
        EXPECT_EQ(location.toString(), u"s://h/a/b");
        EXPECT_EQ(location.iris, 1);
    }
    for (int i = 0; i != 2; ++i) {
        static_cast<void>(location.getName());
        EXPECT_EQ(location.paths, 1);
    }
    for (int i = 0; i != 2; ++i) {
        static_cast<void>(location.getParent());
        EXPECT_EQ(location.relatives, 1);
    }
    for (int i = 0; i != 2; ++i) {
        static_cast<void>(location.getRoot());
        EXPECT_EQ(location.relatives, 2);
    }
    EXPECT_EQ(location.iris, 2);
    EXPECT_EQ(location.paths, 1);
}

TEST(HierarchicalImpl, AsksTheIriAtEachCallForWhatIsNotKept)
{
    Counting const location{IRI(u"s://h/a/b")};
    static_cast<void>(location.getScheme());
    static_cast<void>(location.getScheme());
    EXPECT_EQ(location.iris, 2);
    static_cast<void>(location.hasPath());
    static_cast<void>(location.getHost());
    static_cast<void>(location.hasHost());
    EXPECT_EQ(location.iris, 5);
}

TEST(HierarchicalImpl, PathAndFilePathReadTheFieldItself)
{
    Counting const location{IRI(u"s://h/a/b")};
    static_cast<void>(location.getPath());
    static_cast<void>(location.toUPath());
    EXPECT_EQ(location.iris, 0);
}

TEST(HierarchicalImplConcurrency, ManyThreadsGetOneOfEachComputedOnce)
{
    for (int round = 0; round != 10; ++round) {
        Counting const location{IRI(u"s://h/a/./b/../c/")};
        struct Seen
        {
            StorageIRIImpl const* parent;
            StorageIRIImpl const* root;
            std::u16string const* name;
            std::u16string const* text;
            std::u16string const* path;
            std::u16string const* resolvedPath;
            bool operator==(Seen const&) const = default;
        };
        std::vector<Seen> seen(32);
        inThreads(32, [&](int i) {
            Seen& mine = seen[static_cast<std::size_t>(i)];
            mine.parent = location.getParent().get();
            mine.name = &location.getName();
            mine.text = &location.toString();
            mine.path = &location.HierarchicalImpl::getPath();
            mine.root = location.getRoot().get();
            mine.resolvedPath = &location.getResolvedPath();
        });
        EXPECT_EQ(seen, std::vector<Seen>(32, seen.front()));
        EXPECT_EQ(*seen.front().text, u"s://h/a/./b/../c");
        EXPECT_EQ(*seen.front().resolvedPath, u"/a/c");
        EXPECT_EQ(seen.front().parent->toString(), u"s://h/a/./b/..");
        EXPECT_EQ(location.relatives, 2);
        EXPECT_EQ(location.iris, 2);
    }
}

TEST(HierarchicalImplConcurrency, ThreadsThatStartAtDifferentFieldsDoNotBlockEachOther)
{
    for (int round = 0; round != 10; ++round) {
        HierarchicalImpl const location{IRI(u"s://h/a/b")};
        inThreads(32, [&](int i) {
            switch (i % 6) {
            case 0:
                EXPECT_EQ(location.getParent()->getPath(), u"/a");
                break;
            case 1:
                EXPECT_EQ(location.getName(), u"b");
                break;
            case 2:
                EXPECT_EQ(location.toString(), u"s://h/a/b");
                break;
            case 3:
                EXPECT_EQ(location.getPath(), u"/a/b");
                break;
            case 4:
                EXPECT_EQ(location.getRoot()->getPath(), u"/");
                break;
            default:
                EXPECT_EQ(location.getResolvedPath(), u"/a/b");
            }
        });
    }
}

} // namespace
} // namespace foundation::storage::provider::detail
