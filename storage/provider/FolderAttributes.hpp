#pragma once

#include <storage/provider/FileAttributes.hpp>

namespace foundation::storage::provider {

/// What is known of a folder: when it was last modified, and whether it can be written.
/// Writability is given and asked for as in `FileAttributes`.
class FOUNDATION_API FolderAttributes
{
public:
    FolderAttributes(boost::posix_time::ptime const& lastModified, bool writable);
    FolderAttributes(boost::posix_time::ptime const& lastModified, std::function<bool()> writable);

    template <DeferredFlag Callable>
    FolderAttributes(boost::posix_time::ptime const& lastModified, Callable writable)
        : FolderAttributes(lastModified, std::function<bool()>(std::move(writable)))
    {}

    template <MistakenFlag Value>
    FolderAttributes(boost::posix_time::ptime const& lastModified, Value writable) = delete;

    boost::posix_time::ptime getLastModified() const { return lastModified_; }

    /// Throws `std::bad_function_call` when the function given was empty, and whatever the function throws.
    bool isWritable() const { return writable_(); }

private:
    boost::posix_time::ptime lastModified_;
    std::function<bool()> writable_;
};

} // namespace foundation::storage::provider
