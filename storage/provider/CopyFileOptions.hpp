#pragma once

#include <storage/provider/InterruptSignal.hpp>
#include <storage/provider/ReplacementPolicy.hpp>
#include <storage/provider/TransactionPolicy.hpp>

#include <functional>

namespace foundation::storage::provider {

/// How a file is copied from one storage item to another.
struct CopyFileOptions
{
    ReplacementPolicy replacementPolicy{};
    TransactionPolicy transactionPolicy{};
    /// Asked between chunks whether to go on; when empty, the copy cannot be interrupted.
    std::function<InterruptSignal()> interruptFunction{};
};

} // namespace foundation::storage::provider
