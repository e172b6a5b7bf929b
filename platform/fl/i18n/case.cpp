#include <fl/i18n/case.hpp>

#include <unicode/uchar.h>

namespace fl::i18n {

char32_t to_lower(char32_t codePoint)
{
    return static_cast<char32_t>(u_tolower(static_cast<UChar32>(codePoint)));
}

} // namespace fl::i18n
