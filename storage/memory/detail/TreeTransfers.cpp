// Moves and copies within a tree.

#include <storage/memory/detail/Tree.hpp>

#include <storage/memory/detail/paths.hpp>
#include <storage/provider/Exception.hpp>

#include <algorithm>
#include <system_error>
#include <utility>

namespace foundation::storage::memory::detail {

using namespace provider;
using events::Kind;
using EventEntryType = events::EntryType;

namespace {

/// How much is copied between two questions whether to go on.
constexpr std::uint64_t chunkSize = 1048576;
static_assert(chunkSize % Content::blockSize == 0);

bool replaces(ReplacementPolicy policy)
{
    return policy == ReplacementPolicy::Overwrite || policy == ReplacementPolicy::Clobber;
}

void requireReplaceableFile(Node const* target, ReplacementPolicy policy, StorageIRI const& to)
{
    if (target != nullptr && (asFolder(target) != nullptr || !replaces(policy)))
        throw Exception(ErrorCode::ResourceAlreadyExists, to);
}

/// Gives a file its content, and answers in `content` what it held; a failure is one of the location `blamed`.
void fill(File& file, Content& content, StorageIRI const& blamed)
{
    try {
        file.exchange(content);
    } catch (std::system_error const&) {
        throw Exception(ErrorCode::NoSpaceLeft, blamed);
    }
}

/// Answers false when it was interrupted. The first chunk is copied whatever the function would say.
bool copyChunks(Content const& source, Content& copy, IProvider::Interrupt const& interrupt)
{
    do {
        copy.extendFrom(source, std::min(source.size(), copy.size() + chunkSize));
        if (interrupt && interrupt() != InterruptSignal::Continue)
            return false;
    } while (copy.size() < source.size());
    return true;
}

} // namespace

void Tree::moveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy)
{
    Node replaced;
    {
        std::lock_guard const lock(mutex_);
        FilePtr const file = findFile(from);
        Place const source = find(from);
        Place const target = find(to);
        requireReplaceableFile(target.node, policy, to);
        if (source.node == target.node)
            return;
        requireWritable(*source.parent, from);
        requireWritable(*target.parent, to);
        replaced = target.parent->put(target.name, file);
        source.parent->take(source.name);
    }
    notify(Kind::Moved, from, to, EventEntryType::File);
}

void Tree::moveFolder(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy)
{
    {
        std::lock_guard const lock(mutex_);
        FolderPtr const folder = findFolder(from);
        Place const source = find(from);
        Place const target = find(to);
        if (source.parent == nullptr)
            throw Exception(ErrorCode::ResourceInUse, to);
        if (source.node == target.node && replaces(policy))
            return;
        if (target.node != nullptr)
            throw Exception(ErrorCode::ResourceAlreadyExists, to);
        if (isBelow(canonicalPath(to), canonicalPath(from)))
            throw Exception(ErrorCode::InvalidLocation, to);
        requireWritable(*source.parent, from);
        requireWritable(*target.parent, to);
        if (source.parent != target.parent)
            requireWritable(*folder, to); // its ".." changes
        target.parent->put(target.name, folder);
        source.parent->take(source.name);
    }
    notify(Kind::Moved, from, to, EventEntryType::Folder);
}

Tree::CopyEnds Tree::copyEnds(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy) const
{
    if (std::optional<Place> const target = tryFind(to))
        requireReplaceableFile(target->node, policy, to);
    FilePtr const file = findFile(from);
    Place const target = find(to);
    return {file, target.node == nullptr ? nullptr : std::get<FilePtr>(*target.node), target};
}

void Tree::copyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy)
{
    Content content;
    Kind kind = Kind::Modified;
    {
        std::lock_guard const lock(mutex_);
        CopyEnds ends = copyEnds(from, to, policy);
        if (ends.source == ends.target)
            return;
        if (ends.target == nullptr) {
            requireWritable(*ends.place.parent, to);
            ends.target = std::make_shared<File>(account_);
            kind = Kind::Created;
        } else if (!ends.target->isWritable()) {
            throw Exception(ErrorCode::PermissionDenied, to);
        }
        content = ends.source->content();
        fill(*ends.target, content, from);
        if (kind == Kind::Created)
            ends.place.parent->put(ends.place.name, ends.target);
    }
    notify(kind, to, EventEntryType::File);
}

TransactionStatus Tree::copyFileAtomic(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy,
                                       IProvider::Interrupt const& interrupt)
{
    Content source;
    {
        std::lock_guard const lock(mutex_);
        CopyEnds const ends = copyEnds(from, to, policy);
        if (ends.source == ends.target)
            return TransactionStatus::Completed;
        requireWritable(*ends.place.parent, to);
        source = ends.source->content();
    }
    Content content;
    if (!copyChunks(source, content, interrupt))
        return TransactionStatus::Aborted;
    auto const copy = std::make_shared<File>(account_);
    fill(*copy, content, to);
    notify(putCopy(copy, to, policy), to, EventEntryType::File);
    return TransactionStatus::Completed;
}

/// What was found before the copy may be otherwise by now, since the tree was free meanwhile.
Kind Tree::putCopy(FilePtr const& copy, StorageIRI const& to, ReplacementPolicy policy)
{
    Node replaced;
    std::lock_guard const lock(mutex_);
    Place const target = find(to);
    requireReplaceableFile(target.node, policy, to);
    requireWritable(*target.parent, to);
    Kind const kind = target.node == nullptr ? Kind::Created : Kind::Modified;
    replaced = target.parent->put(target.name, copy);
    return kind;
}

} // namespace foundation::storage::memory::detail
