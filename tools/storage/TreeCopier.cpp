#include <tools/storage/TreeCopier.hpp>

#include <storage/local/scratchFiles.hpp>
#include <tools/storage/FolderEnd.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/interrupt.hpp>

#include <utility>

namespace foundation::storage::tool {

namespace {

/// Answers whether it was made; an existing one will do.
bool makeFolder(Place const& target)
{
    Kind const kind = kindOf(target);
    switch (kind) {
    case Kind::None:
        at(target, [&] { target.item().createFolder(); });
        break;
    case Kind::RegularFolder:
        break;
    case Kind::SymlinkToFolder:
        throw Failure{target.text(), "a link to a folder, not followed"};
    case Kind::RegularFile:
    case Kind::SpecialFile:
    case Kind::SymlinkToFile:
    case Kind::BrokenSymlink:
        throw Failure{target.text(), "not a folder, and a folder never replaces it"};
    }
    return kind == Kind::None;
}

} // namespace

void TreeCopier::copy(Place const& source, Place const& target)
{
    if (!begin(source, target))
        return;
    while (step())
        checkInterrupt();
    source_.reset();
    target_.reset();
}

/// Opens the source before the target is made, so that nothing is left of a folder that cannot be read.
bool TreeCopier::begin(Place const& source, Place const& target)
{
    try {
        requireCopyable(source);
        source_ = openTree(stores_, source, Listing::NamesOnly, local::StartLink::Refuse);
        bool const isFresh = makeFolder(target);
        target_ = openTree(stores_, target, Listing::NamesOnly, local::StartLink::Refuse);
        areFresh_.clear();
        arrive(isFresh);
        return true;
    } catch (Failure const& failure) {
        run_.fail(source, target, failure);
        return false;
    }
}

void TreeCopier::arrive(bool isFresh)
{
    areFresh_.push_back(isFresh);
    if (isFresh)
        beginFolder(source_->workingPlace(), target_->workingPlace());
    run_.changeFolder();
}

/// Answers whether there is more to do. A listing that fails is through.
bool TreeCopier::step()
{
    std::optional<ListedName> entry;
    try {
        entry = source_->next();
    } catch (Failure const& failure) {
        fail(failure);
        return true;
    }
    if (entry) {
        copyEntry(*entry);
        return true;
    }
    bool const isDone = source_->depth() == 0;
    leave();
    return !isDone;
}

void TreeCopier::fail(Failure const& failure)
{
    run_.fail(source_->place(), target_->place(), failure);
}

/// What a listing calls a folder may be a link to one. What somebody is still writing is nobody else's.
void TreeCopier::copyEntry(ListedName const& entry)
{
    if (entry.isFile && local::isScratchName(entry.name))
        return;
    Place source = source_->workingPlaceOf(entry);
    Place target = target_->workingPlaceOf(entry);
    if (!entry.isFile)
        return enter(entry, source, target);
    keep(source);
    keep(target);
    run_.copyFile(std::move(source), std::move(target), areFresh_.back() ? TargetState::Free : TargetState::Unknown);
}

void TreeCopier::enter(ListedName const& entry, Place const& source, Place const& target)
{
    std::size_t const depth = source_->depth();
    try {
        requireCopyable(source);
        if (!source_->enter(entry))
            throw Failure{source.text(), "became something else meanwhile"};
        bool const isFresh = makeFolder(target);
        if (!target_->enter(entry))
            throw Failure{target.text(), "became something else meanwhile"};
        arrive(isFresh);
    } catch (Failure const& failure) {
        run_.fail(source, target, failure);
        if (source_->depth() > depth)
            leaveBoth();
    }
}

void TreeCopier::leave()
{
    try {
        Place const source = source_->workingPlace();
        Place const target = target_->workingPlace();
        keep(source);
        keep(target);
        run_.finishFolder(source, target, areFresh_.back());
    } catch (Failure const& failure) {
        fail(failure);
    }
    if (source_->depth() > 0)
        leaveBoth();
}

/// Goes back at both ends, further at both where one of them has to, because folders were moved away.
void TreeCopier::leaveBoth()
{
    std::size_t depth = source_->depth() - 1;
    for (TreeCursor* const end : {source_.get(), target_.get(), source_.get()}) {
        while (end->depth() > depth) {
            try {
                end->leave();
            } catch (Failure const& failure) {
                fail(failure);
            }
        }
        depth = end->depth();
    }
    areFresh_.resize(depth + 1);
    run_.changeFolder();
}

/// Each folder that a copy may need takes a descriptor until that is done.
void TreeCopier::keep(Place const& place)
{
    constexpr std::size_t maximum = 32;
    if (!place.hold() || (!held_.empty() && held_.back().lock() == place.hold()) ||
        (held_.size() > 1 && held_[held_.size() - 2].lock() == place.hold()))
        return;
    if (held_.size() >= maximum)
        std::erase_if(held_, [](std::weak_ptr<void const> const& folder) { return folder.expired(); });
    if (held_.size() >= maximum)
        run_.settle();
    held_.push_back(place.hold());
}

} // namespace foundation::storage::tool
