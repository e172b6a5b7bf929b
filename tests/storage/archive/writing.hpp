#pragma once

#include <storage/archive/ArchiveException.hpp>
#include <storage/archive/ArchiveProvider.hpp>
#include <storage/conformance/ForwardingProvider.hpp>
#include <storage/provider/StorageItem.hpp>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <utility>

namespace foundation::storage::archive {

/// A zip in a file, and the provider of what is in it.
struct OpenZip
{
    explicit OpenZip(provider::StorageItem const& file, ArchiveLimits const& limits = {})
        : container(file), provider(std::make_shared<ArchiveProvider>(ArchiveFormat::Zip, file, limits))
    {}

    provider::StorageItem root() const
    {
        return provider::StorageItem(provider, provider::StorageIRI(u"zip", container.getLocation(), u"/"));
    }

    provider::StorageItem item(std::u16string const& path) const { return provider::StorageItem(root(), path); }

    void copy(std::u16string const& from, std::u16string const& to) const
    {
        provider->copyFile(item(from).getLocation(), item(to).getLocation(),
                           storage::provider::ReplacementPolicy::Preserve);
    }

    provider::StorageItem container;
    std::shared_ptr<ArchiveProvider> provider;
};

/// What the directory of a zip says of an entry in the field that Unix uses for modes.
std::uint32_t modeOf(std::string const& zip, std::string const& name);

/// The content of an encrypted entry.
std::string decrypted(std::string const& zip, std::string const& name, std::string const& password);

/// A tar with a file "a.zip" of this content in it.
std::string readOnlyArchiveOf(std::string const& content);

/// The reason of the `ArchiveException` that an action ends with.
ArchiveException::Reason reasonOf(std::function<void()> const& action);

/// A store that runs out of space when it is told to. What counts are its operations, and those of its transactional
/// streams.
class ArmedProvider : public conformance::ForwardingProvider, public std::enable_shared_from_this<ArmedProvider>
{
public:
    ArmedProvider(std::shared_ptr<provider::IProvider> store, provider::StorageIRI const& file)
        : ForwardingProvider(std::move(store)), file_(file)
    {}

    /// The file, in this store.
    provider::StorageItem item();

    /// Has the n-th operation from now on fail, counted from 1.
    void arm(std::size_t operation) { left_ = static_cast<long>(operation); }
    void disarm() { left_ = 0; }

    /// Whether the operation that is to fail has not come yet.
    bool isArmed() const { return left_ > 0; }

    /// Has the next transactional stream fail once it has put its file in place.
    void failAfterCommit() { failsAfterCommit_ = true; }

    /// Has transactional streams refuse to seek.
    void refuseToSeek() { seeks_ = false; }

protected:
    void before(char const* operation, provider::StorageIRI const& location) const override;
    std::unique_ptr<provider::TransactionalStream>
    handOutTransaction(std::unique_ptr<provider::TransactionalStream> stream,
                       provider::StorageIRI const& file) const override;

private:
    class Transaction;

    bool isDue() const { return left_ > 0 && --left_ == 0; }

    provider::StorageIRI const file_;
    mutable std::atomic<long> left_ = 0;
    std::atomic<bool> seeks_ = true;
    mutable std::atomic<bool> failsAfterCommit_ = false;
};

} // namespace foundation::storage::archive
