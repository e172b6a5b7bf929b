#pragma once

#include <foundation/export.hpp>
#include <storage/memory/detail/Account.hpp>
#include <storage/memory/detail/Folder.hpp>
#include <storage/memory/detail/Subscriptions.hpp>
#include <storage/provider/ByteStreamOpenOptions.hpp>
#include <storage/provider/ExistenceType.hpp>
#include <storage/provider/IProvider.hpp>
#include <storage/provider/ReplacementPolicy.hpp>
#include <storage/provider/StorageIRI.hpp>
#include <storage/provider/TransactionStatus.hpp>

#include <boost/date_time/posix_time/posix_time_types.hpp>

#include <cstdint>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>

namespace foundation::storage::memory::detail {

using provider::StorageIRI;

/// The part of a location that names its tree: what stands between "mem://" and the next "/", as written.
/// Throws `InvalidLocation` for what is no place in a tree.
FOUNDATION_API std::u16string_view authorityOf(StorageIRI const& iri);

/// The root of the tree that a location belongs to, in the one way to write it. Throws as `authorityOf`.
FOUNDATION_API StorageIRI rootOf(StorageIRI const& iri);

/// A place in the listing of a folder: behind the entry of the name `last`, or before the first.
struct Cursor
{
    FolderPtr folder;
    std::optional<std::u16string> last = {};
    std::optional<std::uint64_t> version = {};  ///< of the folder, while `next` was found
    Folder::Children::const_iterator next = {}; ///< valid as long as that is the folder's version
};

/// An entry as it was when a listing came by.
struct FoundEntry
{
    std::u16string name;
    Node node;
    Status status;
};

/// All files and folders of one authority.
///
/// Locations are those of the tree; any other is `InvalidLocation`. What precedes a "." or ".." in a path must be a
/// folder. Failures are `Exception`s that name the location given, and have changed nothing.
/// Threads: any number at once. One lock guards the folders, and one in each file what the file holds; the tree's comes
/// first where both are taken. None is held while something of the client's is called.
class FOUNDATION_API Tree
{
public:
    enum class Removal
    {
        EmptyFolder,
        FolderAndContents,
    };

    /// A file, and whether opening it changed its content.
    struct OpenedFile
    {
        FilePtr file;
        bool changed;
    };

    /// The tree to which a location belongs, with its root folder and nothing else.
    explicit Tree(StorageIRI const& iri);

    void createFile(StorageIRI const& iri);
    void createFolder(StorageIRI const& iri);
    provider::ExistenceType exists(StorageIRI const& iri) const;
    void removeFile(StorageIRI const& iri);
    void removeFolder(StorageIRI const& iri, Removal removal);

    void moveFile(StorageIRI const& from, StorageIRI const& to, provider::ReplacementPolicy policy);
    void moveFolder(StorageIRI const& from, StorageIRI const& to, provider::ReplacementPolicy policy);
    void copyFile(StorageIRI const& from, StorageIRI const& to, provider::ReplacementPolicy policy);
    provider::TransactionStatus copyFileAtomic(StorageIRI const& from, StorageIRI const& to,
                                               provider::ReplacementPolicy policy,
                                               provider::IProvider::Interrupt const& interrupt);

    Status fileStatus(StorageIRI const& iri) const;
    Status folderStatus(StorageIRI const& iri) const;
    void setLastModified(StorageIRI const& iri, boost::posix_time::ptime const& time);
    void setWritable(StorageIRI const& iri, bool writable);

    /// The content of a file as it is now.
    Content content(StorageIRI const& iri) const;
    OpenedFile open(StorageIRI const& iri, provider::ByteStreamOpenOptions const& options);

    /// The folder at a location.
    FolderPtr folder(StorageIRI const& iri) const;

    /// Goes on to the next name that the folder holds now, in the order of code units; nothing at the end.
    std::optional<FoundEntry> advance(Cursor& cursor) const;

    /// Tells those whom it concerns that something happened at a location.
    void notify(events::Kind kind, StorageIRI const& iri, events::EntryType type) noexcept;

    /// The path of a location of the tree, in the one way to write it.
    std::u16string canonicalPath(StorageIRI const& iri) const;
    StorageIRI canonicalLocation(StorageIRI const& iri) const;

    Account& account() noexcept { return account_; }
    Subscriptions& subscriptions() noexcept { return subscriptions_; }

private:
    /// Where a path leads: a name in a folder, and what it stands for, if anything. The root lies in no folder.
    struct Place
    {
        Folder* parent;
        std::u16string_view name;
        Node const* node;
    };

    /// Both ends of a copy as they are found; the target's file is null when there is none.
    struct CopyEnds
    {
        FilePtr source;
        FilePtr target;
        Place place;
    };

    std::u16string_view pathOf(StorageIRI const& iri) const;
    std::optional<Place> tryFind(StorageIRI const& iri) const;
    Place find(StorageIRI const& iri) const;
    FilePtr const& findFile(StorageIRI const& iri) const;
    FolderPtr const& findFolder(StorageIRI const& iri) const;
    void create(StorageIRI const& iri, Node node, events::EntryType type);
    CopyEnds copyEnds(StorageIRI const& from, StorageIRI const& to, provider::ReplacementPolicy policy) const;
    events::Kind putCopy(FilePtr const& copy, StorageIRI const& to, provider::ReplacementPolicy policy);
    void notify(events::Kind kind, StorageIRI const& from, StorageIRI const& to, events::EntryType type) noexcept;
    template <typename Change>
    void changeAttributes(StorageIRI const& iri, Change const& change);

    std::u16string const authority_;
    StorageIRI const root_;
    mutable std::mutex mutex_;
    Account account_;
    Subscriptions subscriptions_;
    Node const rootNode_;
};

/// Throws `PermissionDenied` for a folder in which nothing may be created or removed.
void requireWritable(Folder const& folder, StorageIRI const& iri);

} // namespace foundation::storage::memory::detail
