#pragma once

#include <tests/storage/local/failures/FailingSystemCalls.hpp>

#include <string>

namespace foundation::tests::support {

/// What an operation makes of a call that fails when it does not fail itself.
enum class Ignored
{
    No,             ///< it has to fail
    WithSameResult, ///< it goes on, and does and finds the same as ever
    WithOtherResult ///< it goes on, and finds something else
};

/// Whether an operation is right to go on; each case has its reason where it stands.
Ignored isIgnored(std::string const& operation, SystemCall const& call, int error);

} // namespace foundation::tests::support
