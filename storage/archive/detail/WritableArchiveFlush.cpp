// How changes reach the archive.

#include <storage/archive/detail/WritableArchive.hpp>

#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/RewriteTarget.hpp>
#include <storage/archive/detail/Source.hpp>
#include <storage/archive/detail/ZipRewrite.hpp>
#include <storage/provider/Exception.hpp>

#include <utility>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

void WritableArchive::flush()
{
    std::lock_guard const gate(gate_);
    std::unique_lock const flushLock(flushMutex_);
    continueAfterFlush();
    {
        std::lock_guard const lock(*treeMutex_);
        if (tree_ == nullptr || !tree_->isChanged())
            return;
    }
    try {
        packDrafts();
        rewrite();
    } catch (Fault const& fault) {
        tryToContinue();
        bool const isOfStore = fault.reason == Reason::StoreFailed;
        throw ArchiveException(isOfStore ? Reason::NotWritten : fault.reason, fault.code, location());
    }
    tryToContinue();
}

/// What was written stays written; who makes the next change is told.
void WritableArchive::tryToContinue()
{
    try {
        continueAfterFlush();
    } catch (provider::Exception const&) {
        // tried again by then
    }
}

/// Whoever writes a file goes on with it, and what he writes from now on waits for the next time.
void WritableArchive::packDrafts()
{
    std::lock_guard const lock(*treeMutex_);
    for (Draft* const draft : drafts_) {
        std::uint64_t version = 0;
        PackedPtr packed = pack(*draft, store_, limits(), Packing::Smallest, version);
        if (draft->settledVersion != version) {
            tree_->takeDraft(draft->node, std::move(packed));
            draft->settledVersion = version;
        }
    }
}

void WritableArchive::requireUnchangedContainer() const
{
    if (inStore([&] { return currentStamp(); }) != baseStamp_)
        throw Fault(Reason::Changed);
}

void WritableArchive::rewrite()
{
    requireUnchangedContainer();
    RewriteTarget target(container(), [this] { requireUnchangedContainer(); });
    try {
        ZipRewrite(*tree_, target).run();
        isWritten_ = true;
    } catch (Fault const&) {
        isWritten_ = target.isSent() && isContainerOfSize(target.size());
        if (isWritten_)
            release();
        throw;
    }
    release();
}

/// Whether it is a new one of that size.
bool WritableArchive::isContainerOfSize(std::uint64_t size) const
{
    try {
        auto const stamp = currentStamp();
        return stamp && stamp != baseStamp_ && stamp->size == size;
    } catch (provider::Exception const&) {
        return false;
    }
}

/// The tree has done its work once it is in the archive, but for files that are still being written. What fails here is
/// tried again with the next change or flush.
void WritableArchive::continueAfterFlush()
{
    std::shared_ptr<PendingTree> old; // goes unlocked
    {
        std::lock_guard const lock(*treeMutex_);
        if (!isWritten_)
            return;
        old = tree_;
        if (drafts_.empty()) {
            tree_.reset();
            isWritten_ = false;
            return;
        }
    }
    Version const version = currentVersion();
    auto tree = std::make_shared<PendingTree>(version.archive, limits());
    std::lock_guard const lock(*treeMutex_);
    if (!isWritten_)
        return;
    for (Draft* const draft : std::set<Draft*>(drafts_))
        carryOver(*draft, *old, *tree);
    tree_ = std::move(tree);
    baseStamp_ = version.stamp;
    isWritten_ = false;
}

void WritableArchive::carryOver(Draft& draft, PendingTree& from, PendingTree& to)
{
    auto const found = to.index().find(from.path(draft.node), Index::LastLink::Keep).id;
    bool const isFound = found && to.index().at(*found).kind == EntryKind::File;
    bool const isSettled = draft.version() == draft.settledVersion;
    if (!isFound || (isSettled && draft.writers == 0)) {
        draft.isLost = !isFound;
        detach(from, draft);
        return;
    }
    to.edit(*found).draft = from.node(draft.node).draft;
    draft.node = *found;
    if (!isSettled)
        to.markChanged();
}

} // namespace foundation::storage::archive::detail
