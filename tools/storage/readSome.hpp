#pragma once

#include <storage/provider/ByteStream.hpp>
#include <tools/storage/Place.hpp>

#include <string_view>
#include <vector>

namespace foundation::storage::tool {

/// A buffer of the size at which copying is fastest.
std::vector<char> makeTransferBuffer();

/// The next bytes of a file; none at the end. Throws `Failure` there, also for a stream that makes no progress.
std::string_view readSome(Place const& file, provider::ByteStream& stream, std::vector<char>& buffer);

} // namespace foundation::storage::tool
