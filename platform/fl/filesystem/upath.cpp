#include <fl/filesystem/upath.hpp>

#include <algorithm>

namespace fl::filesystem {

namespace {

template <class CharT>
std::basic_string<CharT> normalised(std::basic_string<CharT> text)
{
    constexpr CharT separator = '/';
    auto const isRepeated = [](CharT left, CharT right) { return left == separator && right == separator; };
    text.erase(std::unique(text.begin(), text.end(), isRepeated), text.end());
    if (text.size() > 1 && text.back() == separator) {
        text.pop_back();
    }
    return text;
}

} // namespace

template <class CharT>
basic_path<CharT>::basic_path(string_type const& text, bool normalise) : text_(normalise ? normalised(text) : text)
{}

template <class CharT>
typename basic_path<CharT>::string_type const& basic_path<CharT>::string() const noexcept
{
    return text_;
}

template class basic_path<char16_t>;

} // namespace fl::filesystem
