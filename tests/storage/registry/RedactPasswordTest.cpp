#include <storage/registry/redactPassword.hpp>

#include <tests/support/generators.hpp>

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <algorithm>

namespace foundation::storage::registry {
namespace {

using namespace tests::support;

struct Row
{
    char16_t const* location;
    char16_t const* redacted;
};

constexpr Row withPassword[] = {
    {u"s://u:secret@h/x", u"s://u:***@h/x"},
    {u"s://u:secret@h", u"s://u:***@h"},
    {u"s://u:secret@h:80/x@y", u"s://u:***@h:80/x@y"},
    {u"s://u:secret@h?q", u"s://u:***@h?q"},
    {u"s://u:secret@h#f", u"s://u:***@h#f"},
    {u"s://:secret@h/x", u"s://:***@h/x"},
    {u"s://u:***@h/x", u"s://u:***@h/x"},
    {u"s://u:se:cr@et@h/x", u"s://u:***@h/x"},
    {u"s://u:sec!ret@h/x", u"s://u:***@h/x"},
    {u"s://u:sec[ret]@[::1]:80/x", u"s://u:***@[::1]:80/x"},
    {u"s://u%3Asecret@h/x", u"s://u%3A***@h/x"},
    {u"s://u%3asecret@h/x", u"s://u%3a***@h/x"},
    {u"s://u:secret%40h/x", u"s://u:***%40h/x"},
    {u"s://u:1234@h/x", u"s://u:***@h/x"},
    {u"zip:s://u:secret@h/a.zip!/x", u"zip:s://u:***@h/a.zip!/x"},
    {u"zip:tar:s://u:sec!ret@h/a.tar!/b.zip!/c", u"zip:tar:s://u:***@h/a.tar!/b.zip!/c"},
    {u"zip:s://u:secret@h/a.zip", u"zip:s://u:***@h/a.zip"},
    {u"//u:secret@h/x", u"//u:***@h/x"},
    {u"no scheme://u:secret@h/x", u"no scheme://u:***@h/x"},
    {u"://u:secret@h", u"://u:***@h"},
};

/// The password holds what ends an authority.
constexpr Row withSplitPassword[] = {
    {u"s://u:sec/ret@h/x", u"s://u:***@h/x"},
    {u"s://u:sec?ret@h/x", u"s://u:***@h/x"},
    {u"s://u:sec#ret@h/x", u"s://u:***@h/x"},
    {u"s://u:12345678/9@h/x", u"s://u:***@h/x"},
    {u"s://u%3Asec/re@t@h/x", u"s://u%3A***@h/x"},
    {u"s://[::1]:sec/ret@h/x", u"s://[::1]:***@h/x"},
    {u"zip:s://u:sec/ret@h/a.zip!/x", u"zip:s://u:***@h/a.zip!/x"},
};

constexpr char16_t const* withoutPassword[] = {
    u"",
    u"/",
    u"//",
    u"s:",
    u"s:/u:p@h",
    u"s:u:p@h",
    u"s:///u:p@h",
    u"s:/a//u:p@h",
    u"file:////u:p@h",
    u"file:///a//u:p@h/b",
    u"s://u@h/x",
    u"s://u:@h/x",
    u"s://u%3A@h/x",
    u"s://h:80/x",
    u"s://h:80/x@y",
    u"s://h:/x@y",
    u"s://h/x:y@z",
    u"s://h/x//u:p@h",
    u"s://h?u:p@h",
    u"s://h#u:p@h",
    u"s://[::1]/x@y",
    u"s://[::1]:80/x@y",
    u"s://[::1/x@y",
    u"s://u@[::1]:80/x",
    u"s://h:port/x",
    u"s://u%40mail@h:80/x",
    u"zip:s://h!/x:y@z",
    u"zip:s://h:80!/x@y",
    u"zip:file:///a.zip!//u:p@h",
};

TEST(RedactPassword, PutsStarsForThePassword)
{
    for (Row const& row : withPassword) {
        EXPECT_TRUE(hasPassword(row.location)) << shown(row.location);
        EXPECT_EQ(redactPassword(row.location), row.redacted) << shown(row.location);
    }
}

TEST(RedactPassword, TakesAPortThatIsNoneForABrokenPassword)
{
    for (Row const& row : withSplitPassword) {
        EXPECT_TRUE(hasPassword(row.location)) << shown(row.location);
        EXPECT_EQ(redactPassword(row.location), row.redacted) << shown(row.location);
    }
}

TEST(RedactPassword, LeavesOtherTextAlone)
{
    for (char16_t const* const text : withoutPassword) {
        EXPECT_FALSE(hasPassword(text)) << shown(text);
        EXPECT_EQ(redactPassword(text), text) << shown(text);
    }
}

RC_GTEST_PROP(RedactPassword, LeavesNothingOfAnyPassword, ())
{
    std::u16string password = *anyText();
    std::erase_if(password, [](char16_t c) { return c == u'/' || c == u'?' || c == u'#'; });
    RC_PRE(!password.empty());
    std::u16string const outer = *rc::gen::element<std::u16string>(u"", u"zip:", u"zip:tar:");
    std::u16string const rest = *rc::gen::element<std::u16string>(u"@h", u"@h/x", u"@h:80/a@b!/c", u"@[::1]?q@r");
    RC_ASSERT(redactPassword(outer + u"s://u:" + password + rest) == outer + u"s://u:***" + rest);
}

RC_GTEST_PROP(RedactPassword, OfAnyTextIsDoneAtOnce, ())
{
    std::u16string const once = redactPassword(*anyText());
    RC_ASSERT(redactPassword(once) == once);
}

} // namespace
} // namespace foundation::storage::registry
