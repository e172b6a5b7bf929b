#pragma once

#include <string_view>
#include <vector>

namespace foundation::storage::tool {

/// The next bytes of standard input; none at the end. Throws `Failure`, and `Interrupted` also while it waits.
std::string_view readStandardInput(std::vector<char>& buffer);

} // namespace foundation::storage::tool
