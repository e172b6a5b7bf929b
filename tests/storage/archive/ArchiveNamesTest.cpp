#include <storage/archive/ArchiveProvider.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/LocalProvider.hpp>
#include <tests/storage/archive/archives.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/support/Process.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <gmock/gmock.h>

#include <algorithm>
#include <clocale>
#include <filesystem>
#include <initializer_list>
#include <memory>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;
using testing::ElementsAre;
using testing::UnorderedElementsAre;
using testing::UnorderedElementsAreArray;

namespace {

/// Has the program use a locale until it goes.
class Locale
{
public:
    explicit Locale(char const* name) { EXPECT_NE(std::setlocale(LC_ALL, name), nullptr); }
    ~Locale() { std::setlocale(LC_ALL, "C"); }
};

std::vector<Member> called(std::vector<std::string> const& names)
{
    std::vector<Member> members;
    for (std::string const& name : names)
        members.push_back({.name = name, .content = name});
    return members;
}

std::vector<Kind> kindsOf(std::initializer_list<ArchiveFormat> formats)
{
    std::vector<Kind> kinds = kindsOfArchives();
    std::erase_if(kinds, [&](Kind const& kind) {
        return std::find(formats.begin(), formats.end(), kind.format) == formats.end();
    });
    return kinds;
}

void expectInEveryLocale(Kind const& kind, std::vector<std::string> const& names)
{
    std::string const bytes = makeArchive(kind.writer, kind.compression, called(names));
    std::vector<std::u16string> shown;
    for (std::string const& name : names)
        shown.push_back(fl::filesystem::from_native_bytes(name));
    for (char const* const locale : {"C", "C.UTF-8"}) {
        SCOPED_TRACE(std::string(kind.name) + " in " + locale);
        Locale const inUse(locale);
        StorageItem const root = openRoot(kind.format, makeFile(bytes));
        EXPECT_THAT(pathsBelow(root), UnorderedElementsAreArray(shown));
        for (std::size_t i = 0; i != names.size(); ++i)
            EXPECT_EQ(read(root, shown[i]), names[i]);
    }
}

TEST(ArchiveNames, AreTheBytesOfTheArchiveInEveryLocale)
{
    for (Kind const& kind : kindsOf({ArchiveFormat::Tar, ArchiveFormat::Cpio, ArchiveFormat::Iso}))
        expectInEveryLocale(kind,
                            {"plain", "caf\xC3\xA9", "cafe\xCC\x81", "\xE4\xB8\xAD\xE6\x96\x87", "\xF0\x9F\x98\x80",
                             "latin caf\xE9", "bad\xFF", "new\nline", "back\\slash", "C:drive"});
}

TEST(ArchiveNames, InUtf16AreTheSameInEveryLocale)
{
    for (Kind const& kind : kindsOf({ArchiveFormat::SevenZip}))
        expectInEveryLocale(kind,
                            {"plain", "caf\xC3\xA9", "\xE4\xB8\xAD\xE6\x96\x87", "\xF0\x9F\x98\x80", "new\nline"});
}

TEST(ArchiveNames, OfJolietAreRead)
{
    TemporaryFolder const folder;
    std::filesystem::create_directory(folder / "in");
    folder.write("in/a name in Joliet, caf\xC3\xA9", "content");
    ASSERT_EQ(
        runProgram({"/usr/bin/env", "genisoimage", "-quiet", "-J", "-input-charset", "utf-8", "-o", "../image", "."},
                   {.workingFolder = folder / "in"})
            .status,
        0);
    StorageItem const image(std::make_shared<local::LocalProvider>(), folder.iri(u"image"));
    StorageItem const root = openRoot(ArchiveFormat::Iso, image);
    EXPECT_THAT(pathsBelow(root), ElementsAre(u"a name in Joliet, caf\u00E9"));
    EXPECT_EQ(read(root, u"a name in Joliet, caf\u00E9"), "content");
}

TEST(ArchiveNames, ThatLeadElsewhereStayBelowTheRoot)
{
    for (Kind const& kind : kindsOf({ArchiveFormat::Tar, ArchiveFormat::Cpio, ArchiveFormat::SevenZip})) {
        SCOPED_TRACE(kind.name);
        StorageItem const root = openRoot(
            kind.format, makeFile(makeArchive(kind.writer, kind.compression,
                                              called({"/absolute", "../up", "a/../../b", "./c//d", "twice", "twice",
                                                      "file", "file/in", "..\\back", "C:\\drive", "\x01\x7F"}))));
        EXPECT_THAT(pathsBelow(root),
                    UnorderedElementsAre(u"absolute", u"%2E%2E/", u"%2E%2E/up", u"a/", u"a/%2E%2E/",
                                         u"a/%2E%2E/%2E%2E/", u"a/%2E%2E/%2E%2E/b", u"c/", u"c/d", u"twice", u"twice~1",
                                         u"file/", u"file/in", u"file~1", u"..\\back", u"C:\\drive", u"\x01\x7F"));
        EXPECT_EQ(read(root, u"file~1"), "file");
        EXPECT_EQ(read(root, u"file/in"), "file/in");
        EXPECT_EQ(read(root, u"a/%2E%2E/%2E%2E/b"), "a/../../b");
    }
}

} // namespace

} // namespace foundation::storage::archive
