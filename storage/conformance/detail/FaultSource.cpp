#include <storage/conformance/detail/FaultSource.hpp>

#include <storage/provider/Exception.hpp>

#include <ios>
#include <thread>
#include <utility>

namespace foundation::storage::conformance::detail {

InjectedFailure::InjectedFailure(provider::ErrorCode code)
    : ByteStreamFailure("Injected failure.", std::make_error_code(std::io_errc::stream), code)
{}

core::except::IException* InjectedFailure::clone() const
{
    return new InjectedFailure(*this);
}

void InjectedFailure::rethrow() const
{
    throw InjectedFailure(*this);
}

FaultSource::FaultSource(FaultPlan plan) : plan_(std::move(plan)) {}

std::vector<std::string> FaultSource::operations() const
{
    std::lock_guard const lock(mutex_);
    return operations_;
}

std::size_t FaultSource::faults() const
{
    std::lock_guard const lock(mutex_);
    return faults_;
}

void FaultSource::before(char const* operation, provider::StorageIRI const& location)
{
    if (count(operation))
        throw provider::Exception(plan_.code, location);
}

void FaultSource::beforeStream(char const* operation)
{
    if (count(operation))
        throw InjectedFailure(plan_.code);
}

void FaultSource::failStream()
{
    {
        std::lock_guard const lock(mutex_);
        ++faults_;
    }
    throw InjectedFailure(plan_.code);
}

/// Answers whether the operation fails.
bool FaultSource::count(char const* operation)
{
    if (plan_.delay.count() != 0)
        std::this_thread::sleep_for(plan_.delay);
    std::lock_guard const lock(mutex_);
    operations_.emplace_back(operation);
    if (plan_.failing == 0 || (!plan_.counted.empty() && plan_.counted != operation))
        return false;
    ++counted_;
    bool const fails = counted_ == plan_.failing || (plan_.broken && counted_ > plan_.failing);
    faults_ += fails ? 1 : 0;
    return fails;
}

} // namespace foundation::storage::conformance::detail
