#include <fl/i18n/case.hpp>

#include <gtest/gtest.h>

namespace fl::i18n {
namespace {

struct Row
{
    char32_t upper;
    char32_t lower;
};

TEST(Case, LowerCasesAnyScript)
{
    for (auto const& [upper, lower] : {
             Row{U'A', U'a'}, Row{U'\u00C9', U'\u00E9'}, // Latin
             Row{U'\u0130', U'i'},                       // dotted capital I, without a language
             Row{U'\u03A3', U'\u03C3'},                  // sigma, without context
             Row{U'\u0416', U'\u0436'},                  // Cyrillic
             Row{U'\u1E9E', U'\u00DF'},                  // capital sharp s
             Row{U'\u2126', U'\u03C9'},                  // ohm sign
             Row{U'\u10A0', U'\u2D00'},                  // Georgian
             Row{U'\U00010400', U'\U00010428'},          // Deseret
         })
    {
        EXPECT_EQ(to_lower(upper), lower) << std::hex << static_cast<unsigned>(upper);
    }
}

TEST(Case, LeavesEverythingElse)
{
    for (char32_t const same : {U'\0', U'a', U'/', U'1', U'\u00DF', U'\u4E2D', char32_t{0xD800}, U'\U0001F4C1',
                                char32_t{0x10FFFF}, char32_t{0x110000}, char32_t{0xFFFFFFFF}})
    {
        EXPECT_EQ(to_lower(same), same) << std::hex << static_cast<unsigned>(same);
    }
}

} // namespace
} // namespace fl::i18n
