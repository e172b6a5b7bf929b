#include <storage/provider/detail/splitName.hpp>

namespace foundation::storage::provider::detail {

std::pair<std::u16string, std::u16string> splitName(std::u16string const& path)
{
    if (path == u"/")
        return {std::u16string(), path};
    std::size_t const lastButOne = path.size() < 2 ? std::u16string::npos : path.rfind(u'/', path.size() - 2);
    std::size_t const start = lastButOne == std::u16string::npos ? 0 : lastButOne + 1;
    std::size_t const end = path.find(u'/', start);
    return {path.substr(0, start), path.substr(start, end == std::u16string::npos ? end : end - start)};
}

} // namespace foundation::storage::provider::detail
