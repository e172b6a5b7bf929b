#include <foundation/storage/utility/decodeURL.hpp>

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <string>
#include <vector>

#include <foundation/network/IRI.hpp>
#include <tests/support/generators.hpp>

namespace foundation::storage::utility {
namespace {

using tests::support::shown;
using tests::support::Text;

std::u16string decoded(std::u16string text)
{
    decodeURL(text);
    return text;
}

struct Row
{
    std::u16string written;
    std::u16string plain;
};

TEST(DecodeURL, DecodesEscapesThatFormUtf8AndLeavesTheOthers)
{
    for (auto const& [written, plain] : std::vector<Row>{
             {u"", u""},
             {u"a b", u"a b"},
             {u"%41%62", u"Ab"},
             {u"%2f%2F", u"//"},
             {u"%25", u"%"},
             {u"%2541", u"%41"},
             {u"%00", std::u16string(1, u'\0')},
             {u"%7F", u"\x7F"},
             {u"%C3%A9", u"\u00E9"},
             {u"%c3%a9x", u"\u00E9x"},
             {u"%E4%BD%A0", u"\u4F60"},
             {u"%EF%BF%BF", u"\uFFFF"},
             {u"%F0%9F%98%80", u"\U0001F600"},
             {u"%F4%8F%BF%BF", u"\U0010FFFF"},
             {u"+", u"+"},
             {u"%", u"%"},
             {u"%4", u"%4"},
             {u"%4z", u"%4z"},
             {u"%%41", u"%A"},
             {u"%80", u"%80"},
             {u"%FF", u"%FF"},
             {u"%C3", u"%C3"},
             {u"%C3%41", u"%C3A"},
             {u"%C3x%A9", u"%C3x%A9"},
             {u"%C3%C3%A9", u"%C3\u00E9"},
             {u"%E4%BD", u"%E4%BD"},
             {u"%E4%BD%41", u"%E4%BDA"},
             {u"%C0%AF", u"%C0%AF"},
             {u"%C1%BF", u"%C1%BF"},
             {u"%E0%80%AF", u"%E0%80%AF"},
             {u"%E0%9F%BF", u"%E0%9F%BF"},
             {u"%F0%8F%BF%BF", u"%F0%8F%BF%BF"},
             {u"%ED%A0%80", u"%ED%A0%80"},
             {u"%ED%BF%BF", u"%ED%BF%BF"},
             {u"%F4%90%80%80", u"%F4%90%80%80"},
             {u"%F8%88%80%80%80", u"%F8%88%80%80%80"},
         })
        EXPECT_EQ(shown(decoded(written)), shown(plain)) << shown(written);
}

RC_GTEST_PROP(DecodeURL, UndoesTheEncodingOfEveryText, ())
{
    Text const text = *tests::support::anyText();
    RC_ASSERT(shown(decoded(network::iri::encodePath(text.value))) == shown(text.value));
}

RC_GTEST_PROP(DecodeURL, ReadsAPathAsTheIriDoes, ())
{
    network::IRI const iri(u"s:/" + (*tests::support::anyText()).value);
    RC_ASSERT(shown(decoded(iri.getPath(network::iri::Encoding::Encoded))) ==
              shown(iri.getPath(network::iri::Encoding::Decoded)));
}

} // namespace
} // namespace foundation::storage::utility
