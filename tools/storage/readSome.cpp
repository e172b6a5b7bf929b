#include <tools/storage/readSome.hpp>

#include <tools/storage/describe.hpp>

namespace foundation::storage::tool {

std::vector<char> makeTransferBuffer()
{
    return std::vector<char>(std::size_t{256} << 10U);
}

std::string_view readSome(Place const& file, provider::ByteStream& stream, std::vector<char>& buffer)
{
    auto const capacity = static_cast<long>(buffer.size());
    long const count = at(file, [&] { return stream.read(buffer.data(), capacity); });
    if (count == 0 || count > capacity)
        throw Failure{file.text(), describe(provider::ErrorCode::IOError)};
    return count < 0 ? std::string_view() : std::string_view(buffer.data(), static_cast<std::size_t>(count));
}

} // namespace foundation::storage::tool
