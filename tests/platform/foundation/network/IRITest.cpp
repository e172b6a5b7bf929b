#include <foundation/network/IRI.hpp>

#include <gtest/gtest.h>

#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include <tests/support/generators.hpp>

namespace foundation::network {
namespace {

using iri::Encoding;
using tests::support::shown;

TEST(IRI, IsMadeExplicitlyCopiedAndMoved)
{
    EXPECT_FALSE((std::is_convertible_v<std::u16string, IRI>));
    IRI original(u"s://h/a");
    IRI const copy = original;
    IRI const moved = std::move(original);
    EXPECT_EQ(copy.toString(), u"s://h/a");
    EXPECT_EQ(moved.toString(), u"s://h/a");
    original = copy;
    EXPECT_EQ(original.getHost(Encoding::Decoded), u"h");
}

TEST(IRI, NumbersItsEncodingSelectors)
{
    EXPECT_EQ(static_cast<int>(Encoding::Decoded), 0);
    EXPECT_EQ(static_cast<int>(Encoding::Encoded), 1);
}

struct Components
{
    std::u16string text;
    bool absolute;
    bool opaque;
    bool hasHost;
    std::u16string scheme;
    std::u16string host;
    std::u16string path;
    std::u16string schemeSpecificPart;
};

TEST(IRI, SplitsItsTextIntoComponents)
{
    for (Components const& row : std::vector<Components>{
             {u"", false, false, false, u"", u"", u"", u""},
             {u"s://h/a/b", true, false, true, u"s", u"h", u"/a/b", u"//h/a/b"},
             {u"s://h", true, false, true, u"s", u"h", u"", u"//h"},
             {u"s:///a", true, false, true, u"s", u"", u"/a", u"///a"},
             {u"s://", true, false, true, u"s", u"", u"", u"//"},
             {u"f:/x.c", true, false, false, u"f", u"", u"/x.c", u"/x.c"},
             {u"s:f:/x.c!/d", true, true, false, u"s", u"", u"f:/x.c!/d", u"f:/x.c!/d"},
             {u"s:", true, true, false, u"s", u"", u"", u""},
             {u"s:?q", true, true, false, u"s", u"", u"", u"?q"},
             {u"mailto:a@b.c", true, true, false, u"mailto", u"", u"a@b.c", u"a@b.c"},
             {u"s://h/a?q/r#f?g#h", true, false, true, u"s", u"h", u"/a", u"//h/a?q/r#f?g#h"},
             {u"s://h?q", true, false, true, u"s", u"h", u"", u"//h?q"},
             {u"s://h#f", true, false, true, u"s", u"h", u"", u"//h#f"},
             {u"s://u:p@h:8080/a", true, false, true, u"s", u"h", u"/a", u"//u:p@h:8080/a"},
             {u"s://a@b@h/", true, false, true, u"s", u"h", u"/", u"//a@b@h/"},
             {u"s://h:/", true, false, true, u"s", u"h", u"/", u"//h:/"},
             {u"s://[::1]/", true, false, true, u"s", u"[::1]", u"/", u"//[::1]/"},
             {u"s://[::1]:22/", true, false, true, u"s", u"[::1]", u"/", u"//[::1]:22/"},
             {u"s://h:x/", true, false, true, u"s", u"h:x", u"/", u"//h:x/"},
             {u"A+1.-z:/p", true, false, false, u"A+1.-z", u"", u"/p", u"/p"},
             {u"//h/a", false, false, true, u"", u"h", u"/a", u"//h/a"},
             {u"/a:b", false, false, false, u"", u"", u"/a:b", u"/a:b"},
             {u"rel/a", false, false, false, u"", u"", u"rel/a", u"rel/a"},
             {u"./a:b", false, false, false, u"", u"", u"./a:b", u"./a:b"},
             {u"1s:/a", false, false, false, u"", u"", u"1s:/a", u"1s:/a"},
             {u":/a", false, false, false, u"", u"", u":/a", u":/a"},
             {u"s_t:/a", false, false, false, u"", u"", u"s_t:/a", u"s_t:/a"},
             {u"\u00E9:/a", false, false, false, u"", u"", u"\u00E9:/a", u"\u00E9:/a"},
             {u"s", false, false, false, u"", u"", u"s", u"s"},
             {u"?q:r", false, false, false, u"", u"", u"", u"?q:r"},
         })
    {
        SCOPED_TRACE(shown(row.text));
        IRI const iri(row.text);
        EXPECT_EQ(iri.isAbsolute(), row.absolute);
        EXPECT_EQ(iri.isOpaque(), row.opaque);
        EXPECT_EQ(iri.hasHost(), row.hasHost);
        EXPECT_EQ(iri.getScheme(), row.scheme);
        EXPECT_EQ(iri.getHost(Encoding::Decoded), row.host);
        EXPECT_EQ(iri.getPath(Encoding::Decoded), row.path);
        EXPECT_EQ(iri.getSchemeSpecificPart(Encoding::Decoded), row.schemeSpecificPart);
        EXPECT_EQ(iri.getSchemeSpecificPart(Encoding::Encoded), row.schemeSpecificPart);
        EXPECT_EQ(iri.toString(), row.text);
    }
}

TEST(IRI, DecodesHostAndPathUnderSelectorZeroAlone)
{
    IRI const iri(u"s://h%C3%A9%41/a%20b%2F%E4%BD%A0%FF?%41");
    EXPECT_EQ(iri.getHost(Encoding::Decoded), u"h\u00E9A");
    EXPECT_EQ(iri.getHost(Encoding::Encoded), u"h%C3%A9%41");
    EXPECT_EQ(iri.getPath(Encoding::Decoded), u"/a b/\u4F60%FF");
    EXPECT_EQ(iri.getPath(Encoding::Encoded), u"/a%20b%2F%E4%BD%A0%FF");
    EXPECT_EQ(iri.getSchemeSpecificPart(Encoding::Decoded), u"//h%C3%A9%41/a%20b%2F%E4%BD%A0%FF?%41");
}

TEST(IRI, EncodesOnlyWhatNoIriMayHold)
{
    for (auto const& [text, written] : std::vector<std::pair<std::u16string, std::u16string>>{
             {u"s://h/a b", u"s://h/a%20b"},
             {u"s:/\"<>\\^`{|}", u"s:/%22%3C%3E%5C%5E%60%7B%7C%7D"},
             {u"s:/\t\n\u007F", u"s:/%09%0A%7F"},
             {u"s:/\u0080\u0085\u009F", u"s:/%C2%80%C2%85%C2%9F"},
             {std::u16string(u"s:/\0", 4), u"s:/%00"},
             {u"s:/%", u"s:/%25"},
             {u"s:/%4", u"s:/%254"},
             {u"s:/%4z", u"s:/%254z"},
             {u"s:/%%41", u"s:/%25%41"},
             {u"s:/%41%e9", u"s:/%41%e9"},
             {u"s:/[]!$&'()*+,;=:@~-._", u"s:/[]!$&'()*+,;=:@~-._"},
             {u"s:/\u00E9\u4F60\U0001F600e\u0301\uE000\uFFFE", u"s:/\u00E9\u4F60\U0001F600e\u0301\uE000\uFFFE"},
             {u"s:/a?b c#d e", u"s:/a?b%20c#d%20e"},
             {u"s://a b/", u"s://a%20b/"},
             {u"a b:/x", u"a%20b:/x"},
         })
        EXPECT_EQ(shown(IRI(text).toString()), shown(written));
}

TEST(IRI, RefusesALoneSurrogate)
{
    try {
        IRI const iri(std::u16string{u's', u':', u'/', char16_t{0xD800}});
        ADD_FAILURE() << "accepted";
    } catch (std::out_of_range const& error) {
        EXPECT_STREQ(error.what(),
                     "Misplaced UTF-16 surrogate U+0xd800 encountered while trying to encode UTF-32 sequence");
    }
}

TEST(IRI, RefusesAPortBeyond65535)
{
    for (std::u16string const text : {u"s://h:65536/", u"s://h:100000/", u"//h:99999999999999999999999", u"s://:65536"})
        EXPECT_THROW(IRI{text}, std::invalid_argument) << shown(text);
    for (std::u16string const text :
         {u"s://h:65535/", u"s://h:0000065535/", u"s://h:0/", u"s://h/:65536", u"s:h:65536"})
        EXPECT_NO_THROW(IRI{text}) << shown(text);
}

TEST(IRI, PrintsAnAuthorityOnlyWhereThereIsOne)
{
    EXPECT_EQ(IRI(u"file:///tmp").toString(), u"file:///tmp");
    EXPECT_EQ(IRI(u"f:/x").toString(), u"f:/x");
}

TEST(IRI, LosesOneWrittenTrailingSlash)
{
    for (auto const& [text, stripped] : std::vector<std::pair<std::u16string, std::u16string>>{
             {u"s://h/a/b/", u"s://h/a/b"},
             {u"s://h/a/b", u"s://h/a/b"},
             {u"s://h//", u"s://h/"},
             {u"s://h/", u"s://h/"},
             {u"s://h", u"s://h"},
             {u"s://h/a///", u"s://h/a//"},
             {u"s://h/a%2F", u"s://h/a%2F"},
             {u"s://h/a%2F/", u"s://h/a%2F"},
             {u"s://h/%41%c3%a9/?q/#f/", u"s://h/%41%c3%a9?q/#f/"},
             {u"s://h/a?q/", u"s://h/a?q/"},
             {u"f:/x/", u"f:/x"},
             {u"f:/%2F/", u"f:/%2F"},
             {u"s:a/", u"s:a"},
         })
        EXPECT_EQ(IRI(text).withoutTrailingSlash().toString(), stripped);
}

TEST(IRI, EncodesAPathByTheRulesOfARecord)
{
    EXPECT_EQ(iri::encodePath(u"/a b%41?#[]!:@\u00E9\U0001F600\uE000\uFFFE"),
              u"/a%20b%2541%3F%23%5B%5D!:@\u00E9\U0001F600%EE%80%80%EF%BF%BE");
    EXPECT_THROW(static_cast<void>(iri::encodePath(std::u16string{char16_t{0xDC00}})), std::out_of_range);
}

} // namespace
} // namespace foundation::network
