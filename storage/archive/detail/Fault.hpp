#pragma once

#include <storage/archive/ArchiveException.hpp>

#include <exception>

namespace foundation::storage::archive::detail {

/// Why something of an archive cannot be read, until somebody who knows the location makes an `ArchiveException` or a
/// failure of a stream of it.
struct Fault : std::exception
{
    explicit Fault(ArchiveException::Reason why) : Fault(why, errorCodeOf(why)) {}
    Fault(ArchiveException::Reason why, provider::ErrorCode as) : reason(why), code(as) {}

    char const* what() const noexcept override { return describe(reason); }

    ArchiveException::Reason reason;
    provider::ErrorCode code;
};

/// Calls `action`, and has faults name a location.
template <typename Action>
auto at(provider::StorageIRI const& location, Action const& action)
{
    try {
        return action();
    } catch (Fault const& fault) {
        throw ArchiveException(fault.reason, fault.code, location);
    }
}

} // namespace foundation::storage::archive::detail
