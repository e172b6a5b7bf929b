#pragma once

#include <storage/conformance/ForwardingProvider.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/IFolderEntryIterator.hpp>

#include <memory>
#include <string_view>
#include <vector>

namespace foundation::storage::conformance::broken {

using namespace provider;

using Store = IProvider const&;
using Iri = StorageIRI const&;
using Policy = ReplacementPolicy;
using Options = ByteStreamOpenOptions;
using Kinds = IProvider::EventKinds const&;
using Bytes = std::unique_ptr<ByteStream>;
using Transaction = std::unique_ptr<TransactionalStream>;
using Listing = IProvider::Listing;

/// A listing as it was asked for, with a pattern or with none.
struct ListingCall
{
    Store store;
    std::string_view name;
    Listing (IProvider::*operation)(Iri, std::u16string) const;
    Iri folder;
    std::u16string pattern;

    Listing answer() const { return (store.*operation)(folder, pattern); }
    Listing answerFor(Iri other, std::u16string const& otherPattern) const
    {
        return (store.*operation)(other, otherPattern);
    }
    bool isRecursive() const { return name.find("Recursive") != name.npos; }
};

/// What a provider does otherwise than the sound one, `store`, that stands behind it; as it stands, nothing.
struct Misbehaviour
{
    void (*createFile)(Store store, Iri iri) = nullptr;
    void (*createFolder)(Store store, Iri iri) = nullptr;
    void (*createFolderRecursive)(Store store, Iri iri) = nullptr;
    bool (*fileExists)(Store store, Iri iri) = nullptr;
    bool (*folderExists)(Store store, Iri iri) = nullptr;
    ExistenceType (*exists)(Store store, Iri iri) = nullptr;
    ExistenceTypeExtended (*existsExtended)(Store store, Iri iri) = nullptr;
    void (*removeFile)(Store store, Iri iri) = nullptr;
    void (*removeFolder)(Store store, Iri iri) = nullptr;
    void (*removeFolderRecursively)(Store store, Iri iri) = nullptr;
    void (*moveFile)(Store store, Iri from, Iri to, Policy policy) = nullptr;
    void (*moveFolder)(Store store, Iri from, Iri to, Policy policy) = nullptr;
    void (*copyFile)(Store store, Iri from, Iri to, Policy policy) = nullptr;
    TransactionStatus (*copyFileAtomic)(Store store, Iri from, Iri to, Policy policy,
                                        IProvider::Interrupt const& interrupt) = nullptr;
    FileAttributes (*getFileAttributes)(Store store, Iri iri) = nullptr;
    FolderAttributes (*getFolderAttributes)(Store store, Iri iri) = nullptr;
    void (*setLastModified)(Store store, Iri iri, boost::posix_time::ptime time) = nullptr;
    void (*setWritable)(Store store, Iri iri, bool writable) = nullptr;
    Bytes (*openStream)(Store store, Iri iri, ByteStreamOpenOptions options) = nullptr;
    Bytes (*openReadOnlyStream)(Store store, Iri iri) = nullptr;
    Transaction (*openTransactionalStream)(Store store, Iri iri, ByteStreamOpenOptions options) = nullptr;
    Listing (*list)(ListingCall const& call) = nullptr;
    void (*publishFolderEventsFor)(Store store, Iri iri, ChangeEventCallback const& callback, Kinds kinds) = nullptr;
    void (*publishFileEventsFor)(Store store, Iri iri, ChangeEventCallback const& callback, Kinds kinds) = nullptr;
    void (*stopPublishingEventsFor)(Store store, Iri iri) = nullptr;
    bool (*hasFeature)(Store store, ExtendedFeature feature) = nullptr;
    PathComparator (*getPathComparator)(Store store, Iri iri) = nullptr;
    StorageIRI (*getCanonicalLocation)(Store store, Iri iri) = nullptr;
    FilenameSensitivity (*getFilenameSensitivity)(Store store, Iri iri) = nullptr;

    /// The location that is used in place of another one.
    StorageIRI (*translated)(Iri iri) = nullptr;

    /// Operations of each stream that is handed out, transactional ones excepted.
    long (*read)(ByteStream& stream, char* buffer, long count) = nullptr;
    long (*write)(ByteStream& stream, char const* data, long count) = nullptr;
    long (*seek)(ByteStream& stream, long offset, std::ios_base::seekdir direction) = nullptr;
    void (*close)(ByteStream& stream, int time) = nullptr; ///< `time` counts from 1
};

std::shared_ptr<IProvider> misbehaving(std::shared_ptr<IProvider> sound, Misbehaviour const& misbehaviour);

/// A provider that serves no thread but the one that makes it.
std::shared_ptr<IProvider> servingOneThread(std::shared_ptr<IProvider> sound);

/// The failure of `action` with another code.
template <typename Action>
auto miscoded(Action const& action, ErrorCode code)
{
    try {
        return action();
    } catch (Exception const& error) {
        throw Exception(code, error.getStorageIRI());
    }
}

/// The failure of `action` with another location.
template <typename Action>
auto misplaced(Action const& action, Iri location)
{
    try {
        return action();
    } catch (Exception const& error) {
        throw Exception(error.getErrorCode(), location);
    }
}

/// Writes all but the last byte, and says that it wrote it.
long withoutTheLastByte(ByteStream& stream, char const* data, long count);

/// Does `action`, and does not tell that it failed.
template <typename Action>
void swallowed(Action const& action)
{
    try {
        action();
    } catch (Exception const&) {
    }
}

/// Locations with the last name in small letters, with its accents composed, or cut to 100 characters.
StorageIRI inSmallLetters(Iri iri);
StorageIRI composed(Iri iri);
StorageIRI cutShort(Iri iri);

StorageIRI sibling(Iri iri, std::u16string const& name);

bool preserves(Policy policy);

std::vector<FolderEntry> entriesOf(Listing const& listing);

/// The entries of a listing that `wanted` lets through.
Listing filtered(Listing const& listing, bool (*wanted)(FolderEntry const& entry));

/// Copies at most so many bytes of a file onto another one, in place.
void copyInPlace(Store store, Iri from, Iri to, long most);

} // namespace foundation::storage::conformance::broken
