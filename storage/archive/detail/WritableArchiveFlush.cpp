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
    {
        std::lock_guard const lock(*treeMutex_);
        if (tree_ == nullptr || !tree_->isChanged())
            return;
    }
    try {
        packDrafts();
        rewrite();
    } catch (Fault const& fault) {
        bool const isOfStore = fault.reason == Reason::StoreFailed;
        throw ArchiveException(isOfStore ? Reason::NotWritten : fault.reason, fault.code, location());
    }
    continueAfterFlush();
}

/// Whoever writes a file goes on with it, and what he writes from now on waits for the next time.
void WritableArchive::packDrafts()
{
    std::lock_guard const lock(*treeMutex_);
    for (Draft* const draft : drafts_) {
        std::uint64_t version = 0;
        PackedPtr packed = pack(*draft, store_, limits(), Packing::Smallest, version);
        if (draft->settledVersion != version) {
            tree_->setContent(draft->node, std::move(packed));
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
    ZipRewrite(*tree_, target).run();
}

/// The tree has done its work, but for files that are still being written.
void WritableArchive::continueAfterFlush()
{
    release();
    std::shared_ptr<PendingTree> const old = tree_; // goes unlocked
    {
        std::lock_guard const lock(*treeMutex_);
        if (drafts_.empty()) {
            tree_.reset();
            return;
        }
    }
    Version const version = currentVersion();
    auto tree = std::make_shared<PendingTree>(version.archive, limits());
    std::lock_guard const lock(*treeMutex_);
    for (Draft* const draft : std::set<Draft*>(drafts_)) {
        auto const found = tree->index().find(old->path(draft->node), Index::LastLink::Keep).id;
        if (!found) {
            detach(*old, *draft);
            continue;
        }
        tree->edit(*found).draft = old->node(draft->node).draft;
        draft->node = *found;
        if (draft->version() != draft->settledVersion)
            tree->markChanged();
    }
    tree_ = std::move(tree);
    baseStamp_ = version.stamp;
}

} // namespace foundation::storage::archive::detail
