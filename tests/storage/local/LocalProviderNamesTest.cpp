#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <tests/support/TemporaryFolder.hpp>

#include <algorithm>
#include <array>
#include <filesystem>
#include <string>
#include <vector>

namespace foundation::storage::local {
namespace {

using namespace provider;
using tests::support::TemporaryFolder;

std::vector<std::string> const oddNames{
    "plain",
    "two words",
    " leading blank",
    "trailing blank ",
    " ",
    ".hidden",
    "...",
    "..leading dots",
    "trailing dots..",
    "%41",
    "%2F",
    "%",
    "%zz",
    "a#b",
    "#",
    "a?b",
    "?",
    "a!b",
    "!",
    "a:b",
    "file:",
    "a\\b",
    "*",
    "[ab]",
    "{a}",
    "\"quoted\"",
    "<tag>",
    "a|b^c`d",
    "~",
    "-rf",
    "a+b&c=d;e@f,g",
    "new\nline",
    "\t\x01\x7F",
    "caf\xC3\xA9",
    "cafe\xCC\x81",
    "\xE4\xB8\xAD\xE6\x96\x87",
    "\xF0\x9F\x93\x81",
    "caf\xE9",
    "\xFF\xFE",
    "\xC0\xAF",
    "\xED\xA0\x80",
    "\xEE\xBE\x80",
    "\xEE\xBF\xBF",
    "\xEE\xBD\xBF",
    "\xEF\xBF\xBD",
    "\xEF\xBB\xBFmark",
    "\xF0\x9F\x93",
    std::string(255, 'x'),
    std::string(255, '\xFF'),
    std::string(255, '%'),
};

std::string contentOf(LocalProvider const& provider, StorageIRI const& iri)
{
    std::array<char, 16> buffer;
    long const count = provider.openReadOnlyStream(iri)->read(buffer.data(), long{buffer.size()});
    return std::string(buffer.data(), static_cast<std::size_t>(count));
}

/// Makes a file with this name by other means, and says what goes wrong on the way from the listing back to the file.
std::string troubleWith(std::string const& name)
{
    TemporaryFolder const folder;
    LocalProvider const provider;
    folder.write(name, "content");
    auto const listing = provider.listAll(folder.iri());
    if (!listing->hasEntry())
        return "not listed";
    StorageIRI const location(folder.iri(), listing->entry().getName());
    if (location.getName() != listing->entry().getName())
        return "the location has another name";
    if (contentOf(provider, location) != "content")
        return "not reached by its location";
    if (contentOf(provider, StorageIRI(location.toString())) != "content")
        return "not reached by the text of its location";
    provider.moveFile(location, folder.iri(u"moved"), ReplacementPolicy::Preserve);
    provider.moveFile(folder.iri(u"moved"), location, ReplacementPolicy::Preserve);
    if (folder.read(name) != "content")
        return "not created by its location";
    provider.removeFile(StorageIRI(location.toString()));
    return std::filesystem::is_empty(folder.path()) ? "" : "not removed";
}

TEST(LocalProviderNames, OfAnyKindLeadFromTheDiskToALocationAndBack)
{
    for (std::string const& name : oddNames)
        EXPECT_EQ(troubleWith(name), "") << name;
}

RC_GTEST_PROP(LocalProviderNames, OfAnyBytesLeadFromTheDiskToALocationAndBack, ())
{
    auto const byte = rc::gen::suchThat(rc::gen::arbitrary<char>(), [](char c) { return c != '\0' && c != '/'; });
    std::string name = *rc::gen::nonEmpty(rc::gen::container<std::string>(byte));
    name.resize(std::min<std::size_t>(name.size(), 255));
    RC_PRE(name != "." && name != "..");
    RC_ASSERT(troubleWith(name) == "");
}

TEST(LocalProviderNames, ThatAreEscapedInTextAreOthersThanThoseThatLookEscaped)
{
    TemporaryFolder const folder;
    folder.write("A", "letter");
    folder.write("%41", "escape");
    LocalProvider const provider;
    EXPECT_EQ(contentOf(provider, StorageIRI(folder.iri().toString() + u"/%41")), "letter");
    EXPECT_EQ(contentOf(provider, StorageIRI(folder.iri().toString() + u"/%2541")), "escape");
    EXPECT_EQ(contentOf(provider, folder.iri(u"%41")), "escape");
}

} // namespace
} // namespace foundation::storage::local
