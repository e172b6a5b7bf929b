#pragma once

#include <foundation/export.hpp>

#include <boost/date_time/posix_time/posix_time_types.hpp>

#include <concepts>
#include <cstdint>
#include <functional>
#include <type_traits>
#include <utility>

namespace foundation::storage::provider {

/// Anything that can be called without arguments for a flag, and is not the flag itself.
template <typename Callable>
concept DeferredFlag =
    std::is_invocable_r_v<bool, Callable&> && !std::same_as<std::remove_cvref_t<Callable>, std::function<bool()>>;

/// What would silently become `true`: a pointer, or a function that answers no flag.
template <typename Value>
concept MistakenFlag = !DeferredFlag<Value> && !std::same_as<std::remove_cvref_t<Value>, std::function<bool()>> &&
                       (std::is_pointer_v<Value> || std::invocable<Value&>);

/// What is known of a file: its size in bytes, when it was last modified, and whether it can be written.
///
/// Writability may be given as a function, which is called on the first `isWritable` and at most once per object, even
/// from several threads at once; a function that throws is called again the next time. A copy made before the first
/// call asks for itself.
class FOUNDATION_API FileAttributes
{
public:
    FileAttributes(std::uint64_t size, boost::posix_time::ptime const& lastModified, bool writable);
    FileAttributes(std::uint64_t size, boost::posix_time::ptime const& lastModified, std::function<bool()> writable);

    /// Without this overload a lambda would be ambiguous, and a function pointer would become `true`.
    template <DeferredFlag Callable>
    FileAttributes(std::uint64_t size, boost::posix_time::ptime const& lastModified, Callable writable)
        : FileAttributes(size, lastModified, std::function<bool()>(std::move(writable)))
    {}

    template <MistakenFlag Value>
    FileAttributes(std::uint64_t size, boost::posix_time::ptime const& lastModified, Value writable) = delete;

    std::uint64_t getSize() const { return size_; }
    boost::posix_time::ptime getLastModified() const { return lastModified_; }

    /// Throws `std::bad_function_call` when the function given was empty, and whatever the function throws.
    bool isWritable() const { return writable_(); }

private:
    std::uint64_t size_;
    boost::posix_time::ptime lastModified_;
    std::function<bool()> writable_;
};

} // namespace foundation::storage::provider
