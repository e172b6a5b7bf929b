#pragma once

#include <functional>

namespace foundation::storage::tool {

/// Does a step that nobody can interrupt, in a thread of its own, and waits for it; throws what it throws.
///
/// When the user asks to stop, throws `Interrupted` and leaves the step behind: it goes on until the program ends, and
/// must own what it works with.
void doOrLeaveBehind(std::function<void()> step);

} // namespace foundation::storage::tool
