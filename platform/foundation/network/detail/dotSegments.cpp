#include <foundation/network/detail/dotSegments.hpp>

#include <algorithm>

namespace foundation::network::detail {

namespace {

void removeLastSegment(std::u16string& path)
{
    std::size_t const slash = path.rfind(u'/');
    path.resize(slash == std::u16string::npos ? 0 : slash);
}

/// Takes `count` characters, a '/' and a dot segment, from the front of the input; a '/' stays in their place.
void replaceBySlash(std::u16string_view& input, std::size_t count)
{
    input = input.size() == count ? std::u16string_view(u"/") : input.substr(count);
}

} // namespace

std::u16string removeDotSegments(std::u16string_view input)
{
    std::u16string output;
    output.reserve(input.size());
    while (!input.empty()) {
        if (input.starts_with(u"../")) {
            input.remove_prefix(3);
        } else if (input.starts_with(u"./")) {
            input.remove_prefix(2);
        } else if (input.starts_with(u"/./") || input == u"/.") {
            replaceBySlash(input, 2);
        } else if (input.starts_with(u"/../") || input == u"/..") {
            replaceBySlash(input, 3);
            removeLastSegment(output);
        } else if (input == u"." || input == u"..") {
            input = {};
        } else {
            std::size_t const end = std::min(input.find(u'/', 1), input.size());
            output += input.substr(0, end);
            input.remove_prefix(end);
        }
    }
    return output;
}

} // namespace foundation::network::detail
