#include <foundation/storage/utility/decodeURL.hpp>

#include <foundation/network/detail/characters.hpp>

namespace foundation::storage::utility {

void decodeURL(std::u16string& text)
{
    text = network::detail::decodeEscapes(text);
}

} // namespace foundation::storage::utility
