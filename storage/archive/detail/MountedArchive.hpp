#pragma once

#include <foundation/export.hpp>
#include <storage/archive/ArchiveException.hpp>
#include <storage/archive/ArchiveFormat.hpp>
#include <storage/archive/ArchiveLimits.hpp>
#include <storage/archive/detail/Archive.hpp>
#include <storage/archive/detail/ArchiveListing.hpp>
#include <storage/provider/ByteStream.hpp>
#include <storage/provider/ExistenceType.hpp>
#include <storage/provider/ExtendedAttributes.hpp>
#include <storage/provider/IProvider.hpp>
#include <storage/provider/StorageItem.hpp>

#include <memory>
#include <mutex>
#include <optional>
#include <set>

namespace foundation::storage::archive::detail {

/// The locations in one container, and what is there, for reading.
///
/// The index is read when it is first needed, and again when a listing begins and the container has changed since.
/// Errors: `Exception` that names the container where that is at fault, else the location.
/// Threads: any number at once; while one reads the index, others wait for it.
class FOUNDATION_API MountedArchive
{
public:
    MountedArchive(ArchiveFormat format, provider::StorageItem container, ArchiveLimits const& limits);
    MountedArchive(MountedArchive const&) = delete;
    MountedArchive& operator=(MountedArchive const&) = delete;
    virtual ~MountedArchive();

    /// Another location that leads to the container.
    void addContainerLocation(provider::StorageIRI const& location);

    /// Without a container there is nothing.
    provider::ExistenceType exists(provider::StorageIRI const& iri) const;
    provider::ExistenceTypeExtended existsExtended(provider::StorageIRI const& iri) const;

    virtual provider::FileAttributes fileAttributes(provider::StorageIRI const& iri) const;
    provider::FolderAttributes folderAttributes(provider::StorageIRI const& iri) const;
    virtual provider::ExtendedAttributes extendedAttributes(provider::StorageIRI const& iri) const;
    virtual std::unique_ptr<provider::ByteStream> open(provider::StorageIRI const& iri) const;
    virtual provider::IProvider::Listing list(provider::StorageIRI const& folder, Selection selection) const;
    provider::StorageIRI canonicalLocation(provider::StorageIRI const& iri) const;

    /// Lets go of the archive, until it is used again. Streams and listings keep what they have.
    void release();

protected:
    using ArchivePtr = std::shared_ptr<Archive const>;

    /// What tells a container from a changed one.
    struct Stamp
    {
        std::uint64_t size;
        boost::posix_time::ptime modified;

        bool operator==(Stamp const&) const = default;
    };

    /// An archive and the moment of its container at which it was opened; neither where there is no container.
    struct Version
    {
        ArchivePtr archive;
        std::optional<Stamp> stamp;
    };

    /// What is to be looked at, and how long it stays as it is: for ever, or as long as the lock is held.
    struct View
    {
        ArchivePtr archive; ///< from which entries have their content; nothing without a container
        Index const* index = nullptr;
        std::unique_lock<std::mutex> lock = {};
    };

    /// Throws where the container is not there.
    virtual View view() const;

    /// Without an index where the container is not there.
    View existingView() const;

    void requireInside(provider::StorageIRI const& iri) const;
    provider::StorageItem const& container() const { return container_; }
    provider::StorageIRI const& location() const { return location_; }
    ArchiveLimits const& limits() const { return limits_; }

    Version currentVersion() const;
    std::optional<Stamp> currentStamp() const;

    Index::Id require(View const& view, provider::StorageIRI const& iri) const;
    Index::Id requireFile(View const& view, provider::StorageIRI const& iri) const;
    Index::Id requireFolder(View const& view, provider::StorageIRI const& iri) const;

private:
    /// Why a container could not be read that has not changed since.
    struct Failure
    {
        Stamp stamp;
        ArchiveException::Reason reason;
        provider::ErrorCode code;
        provider::StorageIRI location;
    };

    bool isContainer(provider::StorageIRI const& location) const;
    std::u16string canonicalPath(std::u16string const& path) const;
    Stamp stampOfContainer() const;
    ArchivePtr archive() const;
    ArchivePtr upToDateArchive() const;
    void rememberFailure(Stamp const& stamp, ArchiveException const& failure) const;
    ArchivePtr const& openLocked(Stamp const& stamp) const;

    ArchiveFormat const format_;
    provider::StorageItem const container_;
    provider::StorageIRI const location_; ///< of the container
    ArchiveLimits const limits_;
    mutable std::mutex otherLocationsMutex_;
    std::set<provider::StorageIRI> otherLocations_; ///< of the container
    mutable std::mutex mutex_;
    mutable ArchivePtr archive_;
    mutable std::optional<Stamp> stamp_;
    mutable std::optional<Failure> failure_;
};

} // namespace foundation::storage::archive::detail
