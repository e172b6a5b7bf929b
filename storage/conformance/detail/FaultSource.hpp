#pragma once

#include <storage/conformance/FaultPlan.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <mutex>
#include <string>
#include <vector>

namespace foundation::storage::conformance::detail {

/// A stream failure that a plan asked for.
class InjectedFailure final : public provider::ByteStreamFailure
{
public:
    explicit InjectedFailure(provider::ErrorCode code);

    core::except::IException* clone() const override;
    [[noreturn]] void rethrow() const override;
};

/// Counts the operations of a provider, its streams and its listings, and fails those that the plan says.
///
/// Threads: any number at once.
class FaultSource
{
public:
    explicit FaultSource(FaultPlan plan);

    FaultPlan const& plan() const { return plan_; }
    std::vector<std::string> operations() const;
    std::size_t faults() const;

    /// Counts an operation at a location; throws `Exception` if it is one that fails.
    void before(char const* operation, provider::StorageIRI const& location);

    /// Counts an operation of a stream; throws `InjectedFailure` if it is one that fails.
    void beforeStream(char const* operation);

    /// Fails on other grounds than the count.
    [[noreturn]] void failStream();

private:
    bool count(char const* operation);

    FaultPlan const plan_;
    mutable std::mutex mutex_;
    std::vector<std::string> operations_;
    std::size_t counted_ = 0;
    std::size_t faults_ = 0;
};

} // namespace foundation::storage::conformance::detail
