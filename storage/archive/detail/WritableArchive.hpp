#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/DraftStream.hpp>
#include <storage/archive/detail/MountedArchive.hpp>
#include <storage/archive/detail/PackStore.hpp>
#include <storage/archive/detail/PendingTree.hpp>
#include <storage/provider/ByteStreamOpenOptions.hpp>
#include <storage/provider/ReplacementPolicy.hpp>
#include <storage/provider/TransactionStatus.hpp>
#include <storage/provider/TransactionalStream.hpp>

#include <cstdint>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <shared_mutex>
#include <string>

namespace foundation::storage::archive::detail {

/// A container whose archive can be changed. Changes are seen by everybody at once, and reach the archive when they are
/// flushed.
///
/// Errors: `Exception` that names the container where that is at fault, else the location; nothing has changed then.
/// Ownership: streams and listings share it.
/// Threads: any number at once. While changes are flushed, who changes waits and who reads does not.
class FOUNDATION_API WritableArchive final : public MountedArchive, public std::enable_shared_from_this<WritableArchive>
{
public:
    using MountedArchive::MountedArchive;

    enum class Removal
    {
        EmptyFolder,
        FolderAndContents,
    };

    provider::FileAttributes fileAttributes(provider::StorageIRI const& iri) const override;
    provider::ExtendedAttributes extendedAttributes(provider::StorageIRI const& iri) const override;
    std::unique_ptr<provider::ByteStream> open(provider::StorageIRI const& iri) const override;
    provider::IProvider::Listing list(provider::StorageIRI const& folder, Selection selection) const override;

    /// Makes an archive with nothing in it, where there is none; answers whether it did. The location is one in it.
    bool createArchive(provider::StorageIRI const& iri);
    void createFile(provider::StorageIRI const& iri);
    void createFolder(provider::StorageIRI const& iri);
    void removeFile(provider::StorageIRI const& iri);
    void removeFolder(provider::StorageIRI const& iri, Removal removal);
    void moveFile(provider::StorageIRI const& from, provider::StorageIRI const& to, provider::ReplacementPolicy policy);
    void moveFolder(provider::StorageIRI const& from, provider::StorageIRI const& to,
                    provider::ReplacementPolicy policy);
    void copyFile(provider::StorageIRI const& from, provider::StorageIRI const& to, provider::ReplacementPolicy policy);

    /// Asks whether to go on for each MiB, though the content itself is shared.
    provider::TransactionStatus copyFileAtomic(provider::StorageIRI const& from, provider::StorageIRI const& to,
                                               provider::ReplacementPolicy policy,
                                               provider::IProvider::Interrupt const& interrupt);
    void setLastModified(provider::StorageIRI const& iri, boost::posix_time::ptime const& time);

    std::unique_ptr<provider::ByteStream> openForWriting(provider::StorageIRI const& iri,
                                                         provider::ByteStreamOpenOptions const& options);
    std::unique_ptr<provider::TransactionalStream> openTransaction(provider::StorageIRI const& iri,
                                                                   provider::ByteStreamOpenOptions const& options);

    /// Writes the archive anew, with all changes, in one step. A file that is being written goes in as it is.
    /// Throws `ArchiveException`; the archive is as it was then, and the changes are kept.
    void flush();

protected:
    View view() const override;

private:
    /// Where a path leads: a name in a folder, and the entry of that name, if any. The root lies in itself.
    struct Place
    {
        Index::Id folder;
        std::u16string name;
        std::optional<Index::Id> id;
    };

    /// What a file holds at one moment.
    struct Held
    {
        PackedPtr packed = {}; ///< else it is that of an entry of `base`
        std::shared_ptr<Archive const> base = {};
        Index::Id origin = Node::none;
        std::uint64_t size = 0;
    };

    /// The right to change the tree, as long as it lives. A tree without changes goes with it.
    class Change
    {
    public:
        explicit Change(WritableArchive& archive);
        ~Change();
        Change(Change const&) = delete;
        Change& operator=(Change const&) = delete;

        PendingTree& tree() const { return *archive_.tree_; }

    private:
        WritableArchive& archive_;
        std::shared_lock<std::shared_mutex> flushLock_;
        std::unique_lock<std::mutex> lock_;
    };

    std::shared_lock<std::shared_mutex> waitForFlush() const;
    void beginTree(std::unique_lock<std::mutex>& lock);
    void beforeChange(PendingTree const& tree);
    void dropUnchangedTree();

    static View viewOf(PendingTree const& tree);
    static Place place(Index const& index, provider::StorageIRI const& iri);
    static Place requireEntry(PendingTree const& tree, provider::StorageIRI const& iri);
    Place newPlace(PendingTree const& tree, provider::StorageIRI const& iri) const;
    Index::Id addFile(PendingTree& tree, Place const& place, provider::StorageIRI const& iri);
    void removeEntry(PendingTree& tree, Index::Id id);
    void detachBelow(PendingTree& tree, Index::Id id);

    provider::IProvider::Listing listNow(provider::StorageIRI const& folder, Selection const& selection) const;
    Held held(provider::StorageIRI const& iri) const;
    static std::unique_ptr<Content> openHeld(Held const& held);
    bool isReplaceable(provider::StorageIRI const& from, provider::StorageIRI const& to,
                       provider::ReplacementPolicy policy) const;
    bool put(provider::StorageIRI const& to, provider::ReplacementPolicy policy, Held const& content);

    std::shared_ptr<Draft> joinDraft(provider::StorageIRI const& iri, provider::ByteStreamOpenOptions const& options);
    bool joinWith(provider::StorageIRI const& iri, std::shared_ptr<Draft> const& draft, Held const& content);
    void attach(PendingTree& tree, Index::Id file, std::shared_ptr<Draft> const& draft);
    void detach(PendingTree& tree, Draft& draft);
    void leave(Draft& draft);
    void settle(Draft& draft, PackedPtr packed, std::uint64_t version);
    void noteWrite(Draft const& draft);
    void commit(provider::StorageIRI const& iri, Draft const& draft);

    void packDrafts();
    void rewrite();
    bool isContainerOfSize(std::uint64_t size) const;
    void requireUnchangedContainer() const;
    void continueAfterFlush();
    void tryToContinue();
    void carryOver(Draft& draft, PendingTree& from, PendingTree& to);

    std::shared_ptr<std::mutex> const treeMutex_ = std::make_shared<std::mutex>();
    mutable std::mutex gate_;
    mutable std::shared_mutex flushMutex_; ///< exclusively held by a flush; comes before the other
    std::shared_ptr<PendingTree> tree_;
    bool isWritten_ = false;         ///< `tree_` is what the archive holds, which has not been opened again yet
    std::optional<Stamp> baseStamp_; ///< of the container that `tree_` began with; nothing when there was none
    std::set<Draft*> drafts_;        ///< those of files in `tree_`
    std::shared_ptr<PackStore> const store_ = std::make_shared<PackStore>(limits().spoolMemory);
};

} // namespace foundation::storage::archive::detail
