#pragma once

#include <string>
#include <vector>

namespace foundation::tests::support {

/// What test doubles were asked to do, in order. Doubles that share one show the order between them.
using CallLog = std::vector<std::string>;

} // namespace foundation::tests::support
