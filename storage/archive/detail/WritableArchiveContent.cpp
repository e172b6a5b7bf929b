// What files hold: reading, writing and copying it.

#include <storage/archive/detail/WritableArchive.hpp>

#include <storage/archive/detail/EntryStream.hpp>
#include <storage/archive/detail/Fault.hpp>
#include <storage/provider/Exception.hpp>

#include <utility>
#include <vector>

namespace foundation::storage::archive::detail {

using namespace provider;
using LastLink = Index::LastLink;

namespace {

constexpr std::size_t chunk = std::size_t{64} << 10;
constexpr std::uint64_t bytesBetweenQuestions = std::uint64_t{1} << 20;

bool replaces(ReplacementPolicy policy)
{
    return policy == ReplacementPolicy::Overwrite || policy == ReplacementPolicy::Clobber;
}

/// Throws `Fault`.
void copyInto(Draft& draft, Content& content, std::uint64_t size)
{
    std::vector<char> buffer(chunk);
    while (draft.size() < size) {
        std::size_t const read = content.read(buffer.data(), buffer.size());
        if (read == 0)
            throw Fault(ArchiveException::Reason::Damaged);
        draft.write(std::nullopt, buffer.data(), read);
    }
    content.finish();
}

/// Calls `action`, which keeps content. What fails then is not the archive, but the place where it is kept.
template <typename Action>
auto keep(StorageIRI const& iri, Action const& action)
{
    try {
        return action();
    } catch (Fault const& fault) {
        if (fault.reason == ArchiveException::Reason::StoreFailed)
            throw Exception(fault.code, iri);
        throw ArchiveException(fault.reason, fault.code, iri);
    }
}

/// Asks at least once.
bool isInterrupted(std::uint64_t size, IProvider::Interrupt const& interrupt)
{
    for (std::uint64_t asked = 0; interrupt && asked <= size / bytesBetweenQuestions; ++asked) {
        if (interrupt() != InterruptSignal::Continue)
            return true;
    }
    return false;
}

} // namespace

WritableArchive::Held WritableArchive::held(StorageIRI const& iri) const
{
    Held result;
    std::shared_ptr<Draft> draft;
    {
        View const view = this->view();
        Index::Id const file = requireFile(view, iri);
        if (view.index->at(file).kind != EntryKind::File)
            throw Exception(ErrorCode::UnsupportedOperation, iri);
        result.base = view.archive;
        result.origin = file;
        result.size = view.index->at(file).size;
        if (view.lock.owns_lock()) {
            PendingNode const& node = tree_->node(file);
            result.origin = node.origin;
            result.packed = node.packed;
            draft = node.draft;
        }
    }
    if (draft != nullptr) {
        std::uint64_t version = 0;
        result.packed = keep(iri, [&] { return pack(*draft, store_, limits(), Packing::Fastest, version); });
    }
    if (result.packed != nullptr)
        result.size = result.packed->size();
    return result;
}

std::unique_ptr<Content> WritableArchive::openHeld(Held const& held)
{
    return held.packed != nullptr ? openPacked(held.packed) : held.base->open(held.origin);
}

std::unique_ptr<ByteStream> WritableArchive::open(StorageIRI const& iri) const
{
    requireInside(iri);
    Held const content = held(iri);
    return at(iri, [&] { return std::make_unique<EntryStream>(iri, openHeld(content), content.size); });
}

/// Answers false for a file copied onto itself. What is wrong with the target is told first.
bool WritableArchive::isReplaceable(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy) const
{
    View const view = existingView();
    if (view.index == nullptr)
        return true;
    auto const target = view.index->find(to.getPath(), LastLink::Follow).id;
    if (target && (view.index->at(*target).kind == EntryKind::Folder || !replaces(policy)))
        throw Exception(ErrorCode::ResourceAlreadyExists, to);
    return !target || target != view.index->find(from.getPath(), LastLink::Follow).id;
}

void WritableArchive::copyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy)
{
    copyFileAtomic(from, to, policy, {});
}

TransactionStatus WritableArchive::copyFileAtomic(StorageIRI const& from, StorageIRI const& to,
                                                  ReplacementPolicy policy, IProvider::Interrupt const& interrupt)
{
    requireInside(from);
    requireInside(to);
    if (!isReplaceable(from, to, policy))
        return TransactionStatus::Completed;
    Held content = held(from);
    at(from, [&] { openHeld(content); }); // content that cannot be read is not copied either
    {
        Change const change(*this);
        newPlace(change.tree(), to);
    }
    if (isInterrupted(content.size, interrupt))
        return TransactionStatus::Aborted;
    while (!put(to, policy, content))
        content = held(from);
    return TransactionStatus::Completed;
}

/// Answers false when the archive was written meanwhile, so that the content is somewhere else now.
bool WritableArchive::put(StorageIRI const& to, ReplacementPolicy policy, Held const& content)
{
    Change const change(*this);
    PendingTree& tree = change.tree();
    if (content.packed == nullptr && content.base != tree.base())
        return false;
    Place const target = newPlace(tree, to);
    if (target.id && (tree.index().at(*target.id).kind == EntryKind::Folder || !replaces(policy)))
        throw Exception(ErrorCode::ResourceAlreadyExists, to);
    beforeChange(tree);
    bool const isFile = target.id && tree.index().at(*target.id).kind == EntryKind::File;
    if (!isFile)
        at(to, [&] { tree.requireRoom(target.name); });
    if (target.id && !isFile)
        removeEntry(tree, *target.id);
    Index::Id const file = isFile ? *target.id : tree.add(target.folder, target.name, EntryKind::File);
    if (tree.node(file).draft != nullptr)
        detach(tree, *tree.node(file).draft);
    if (content.packed != nullptr)
        tree.setContent(file, content.packed);
    else
        tree.setOrigin(file, content.origin);
    tree.setModified(file, currentTime());
    return true;
}

std::unique_ptr<ByteStream> WritableArchive::openForWriting(StorageIRI const& iri, ByteStreamOpenOptions const& options)
{
    requireInside(iri);
    std::shared_ptr<Draft> draft = joinDraft(iri, options);
    DraftStream::Manner const manner{true, options.append == ByteStreamAppend::Append};
    auto const self = shared_from_this();
    return std::make_unique<DraftStream>(
        iri, draft, manner,
        DraftStream::Watcher{[self, draft] { self->noteWrite(*draft); }, [self, draft] { self->leave(*draft); }});
}

/// What the file holds is copied into a new draft unlocked, and again if it has changed by then.
std::shared_ptr<Draft> WritableArchive::joinDraft(StorageIRI const& iri, ByteStreamOpenOptions const& options)
{
    bool const truncates = options.truncate == ByteStreamTruncate::TruncateExisting;
    for (;;) {
        {
            Change const change(*this);
            PendingTree& tree = change.tree();
            Place const target = newPlace(tree, iri);
            bool const isNew = !target.id && options.create == ByteStreamCreate::Create;
            if (!isNew && tree.index().at(requireFile(viewOf(tree), iri)).kind != EntryKind::File)
                throw Exception(ErrorCode::UnsupportedOperation, iri);
            if (isNew || truncates)
                beforeChange(tree);
            Index::Id const file = isNew ? addFile(tree, target, iri) : requireFile(viewOf(tree), iri);
            std::shared_ptr<Draft> draft = tree.node(file).draft;
            if (draft != nullptr || truncates || isNew) {
                if (draft == nullptr) {
                    draft = std::make_shared<Draft>(limits().entryBytes);
                    attach(tree, file, draft);
                    draft->settledVersion = isNew ? std::optional(draft->version()) : std::nullopt;
                }
                if (truncates && !isNew) {
                    draft->truncate();
                    tree.markChanged();
                }
                ++draft->writers;
                return draft;
            }
        }
        Held const content = held(iri);
        auto const draft = std::make_shared<Draft>(limits().entryBytes);
        at(iri, [&] { copyInto(*draft, *openHeld(content), content.size); });
        if (joinWith(iri, draft, content))
            return draft;
    }
}

/// Answers false when the file holds something else by now.
bool WritableArchive::joinWith(StorageIRI const& iri, std::shared_ptr<Draft> const& draft, Held const& content)
{
    Change const change(*this);
    PendingTree& tree = change.tree();
    auto const file = tree.index().find(iri.getPath(), LastLink::Follow).id;
    if (!file || tree.index().at(*file).kind != EntryKind::File || tree.node(*file).draft != nullptr)
        return false;
    PendingNode const& node = tree.node(*file);
    bool const isSame = content.packed != nullptr
                            ? node.packed == content.packed
                            : tree.base() == content.base && node.packed == nullptr && node.origin == content.origin;
    if (!isSame)
        return false;
    beforeChange(tree);
    draft->setModified(tree.index().at(*file).modified);
    attach(tree, *file, draft);
    draft->settledVersion = draft->version();
    ++draft->writers;
    return true;
}

void WritableArchive::attach(PendingTree& tree, Index::Id file, std::shared_ptr<Draft> const& draft)
{
    tree.edit(file).draft = draft;
    draft->node = file;
    drafts_.insert(draft.get());
}

void WritableArchive::detach(PendingTree& tree, Draft& draft)
{
    Index::Id const file = std::exchange(draft.node, Node::none);
    drafts_.erase(&draft);
    tree.edit(file).draft.reset();
}

void WritableArchive::noteWrite(Draft const& draft)
{
    std::lock_guard const lock(*treeMutex_);
    if (draft.isLost)
        throw Fault(ArchiveException::Reason::Changed);
    if (draft.node != Node::none)
        tree_->markChanged();
}

/// Whoever leaves last packs the content.
void WritableArchive::leave(Draft& draft)
{
    {
        std::lock_guard const lock(*treeMutex_);
        --draft.writers;
        if (draft.isLost)
            throw Fault(ArchiveException::Reason::Changed);
        if (draft.writers > 0 || draft.node == Node::none)
            return;
        if (draft.settledVersion == draft.version()) {
            detach(*tree_, draft);
            dropUnchangedTree();
            return;
        }
    }
    std::uint64_t version = 0;
    PackedPtr packed = pack(draft, store_, limits(), Packing::Smallest, version);
    settle(draft, std::move(packed), version);
}

/// Others may have begun to write meanwhile; then the last of them packs. Where the archive has to be opened again
/// first, the next change or flush does both.
void WritableArchive::settle(Draft& draft, PackedPtr packed, std::uint64_t version)
{
    auto const flushLock = waitForFlush();
    std::lock_guard const lock(*treeMutex_);
    if (isWritten_ || draft.node == Node::none || draft.writers > 0 || draft.version() != version)
        return;
    tree_->takeDraft(draft.node, std::move(packed));
    detach(*tree_, draft);
}

std::unique_ptr<TransactionalStream> WritableArchive::openTransaction(StorageIRI const& iri,
                                                                      ByteStreamOpenOptions const& options)
{
    requireInside(iri);
    if (options.create == ByteStreamCreate::NeverCreate) // what is committed is always a new file
        throw Exception(ErrorCode::ResourceNotFound, iri);
    {
        Change const change(*this);
        newPlace(change.tree(), iri);
        beforeChange(change.tree());
    }
    auto const draft = std::make_shared<Draft>(limits().entryBytes);
    DraftStream::Manner const manner{options.access == ByteStreamAccess::ReadWrite,
                                     options.append == ByteStreamAppend::Append};
    return std::make_unique<DraftTransaction>(iri, draft, manner,
                                              [self = shared_from_this(), iri, draft] { self->commit(iri, *draft); });
}

void WritableArchive::commit(StorageIRI const& iri, Draft const& draft)
{
    Held content;
    std::uint64_t version = 0;
    content.packed = keep(iri, [&] { return pack(draft, store_, limits(), Packing::Smallest, version); });
    put(iri, ReplacementPolicy::Overwrite, content);
}

} // namespace foundation::storage::archive::detail
