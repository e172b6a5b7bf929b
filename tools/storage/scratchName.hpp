#pragma once

#include <string>

namespace foundation::storage::tool {

/// A name for a file that is still being written, which nobody else picks: a random UUID and ".tmp.bak".
std::u16string makeScratchName();

/// Whether a name looks like one of these.
bool isScratchName(std::u16string const& name);

} // namespace foundation::storage::tool
