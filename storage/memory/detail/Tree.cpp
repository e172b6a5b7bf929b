#include <storage/memory/detail/Tree.hpp>

#include <storage/memory/detail/paths.hpp>
#include <storage/provider/Exception.hpp>

#include <boost/container/small_vector.hpp>

#include <algorithm>
#include <utility>
#include <vector>

namespace foundation::storage::memory::detail {

using namespace provider;
using events::Kind;
using EventEntryType = events::EntryType;

namespace {

bool isLetter(char16_t unit, char16_t lower)
{
    return unit == lower || (unit >= u'A' && unit <= u'Z' && unit + (u'a' - u'A') == lower);
}

bool hasScheme(std::u16string_view text)
{
    return text.size() >= 4 && isLetter(text[0], u'm') && isLetter(text[1], u'e') && isLetter(text[2], u'm') &&
           text[3] == u':';
}

/// A folder and all that lie below it.
std::vector<Folder*> foldersFrom(Folder& top)
{
    std::vector<Folder*> folders{&top};
    for (std::size_t at = 0; at < folders.size(); ++at) {
        for (auto const& [name, node] : folders[at]->children()) {
            if (FolderPtr const* const child = asFolder(&node))
                folders.push_back(child->get());
        }
    }
    return folders;
}

/// Whether a folder keeps what it holds.
bool isProtected(Folder const* folder)
{
    return !folder->isWritable() && !folder->children().empty();
}

} // namespace

std::u16string_view authorityOf(StorageIRI const& iri)
{
    std::u16string_view text = iri.toString();
    if (!hasScheme(text) || iri.hasInnerIRI() || text.find_first_of(u"?#") != std::u16string_view::npos)
        throw Exception(ErrorCode::InvalidLocation, iri);
    text.remove_prefix(4);
    if (!text.starts_with(u"//"))
        return {};
    text.remove_prefix(2);
    return text.substr(0, text.find(u'/'));
}

StorageIRI rootOf(StorageIRI const& iri)
{
    authorityOf(iri); // refuses what is no place in a tree
    StorageIRI const root(iri, u"/");
    return StorageIRI(u"mem://" + std::u16string(authorityOf(root)) + u"/");
}

void requireWritable(Folder const& folder, StorageIRI const& iri)
{
    if (!folder.isWritable())
        throw Exception(ErrorCode::PermissionDenied, iri);
}

Tree::Tree(StorageIRI const& iri)
    : authority_(authorityOf(rootOf(iri))), root_(rootOf(iri)), rootNode_(Folder::create())
{}

std::u16string_view Tree::pathOf(StorageIRI const& iri) const
{
    // The second comparison is dear, and needed only where the authority is written in another way.
    if (authorityOf(iri) != authority_ && rootOf(iri) != root_)
        throw Exception(ErrorCode::InvalidLocation, iri);
    std::u16string_view const path = iri.getPath();
    if (!path.starts_with(u'/') || path.find(u'\0') != std::u16string_view::npos)
        throw Exception(ErrorCode::InvalidLocation, iri);
    return path;
}

std::u16string Tree::canonicalPath(StorageIRI const& iri) const
{
    return detail::canonicalPath(pathOf(iri));
}

StorageIRI Tree::canonicalLocation(StorageIRI const& iri) const
{
    return StorageIRI(root_, canonicalPath(iri));
}

/// Nothing where the path leads through what is no folder.
std::optional<Tree::Place> Tree::tryFind(StorageIRI const& iri) const
{
    boost::container::small_vector<Place, 16> way{Place{nullptr, u"/", &rootNode_}};
    bool leads = true;
    forEachComponent(pathOf(iri), [&](std::u16string_view component) {
        FolderPtr const* const folder = asFolder(way.back().node);
        leads = leads && folder != nullptr;
        if (!leads || component == u".")
            return;
        if (component != u"..")
            way.push_back({folder->get(), component, (*folder)->find(component)});
        else if (way.size() > 1)
            way.pop_back();
    });
    return leads ? std::optional(way.back()) : std::nullopt;
}

Tree::Place Tree::find(StorageIRI const& iri) const
{
    if (std::optional<Place> const place = tryFind(iri))
        return *place;
    throw Exception(ErrorCode::ResourceNotFound, iri);
}

FilePtr const& Tree::findFile(StorageIRI const& iri) const
{
    FilePtr const* const file = asFile(find(iri).node);
    if (file == nullptr)
        throw Exception(ErrorCode::ResourceNotFound, iri);
    return *file;
}

FolderPtr const& Tree::findFolder(StorageIRI const& iri) const
{
    FolderPtr const* const folder = asFolder(find(iri).node);
    if (folder == nullptr)
        throw Exception(ErrorCode::ResourceNotFound, iri);
    return *folder;
}

void Tree::create(StorageIRI const& iri, Node node, EventEntryType type)
{
    {
        std::lock_guard const lock(mutex_);
        Place const place = find(iri);
        if (place.node != nullptr)
            throw Exception(ErrorCode::ResourceAlreadyExists, iri);
        requireWritable(*place.parent, iri);
        place.parent->put(place.name, std::move(node));
    }
    notify(Kind::Created, iri, type);
}

void Tree::createFile(StorageIRI const& iri)
{
    create(iri, std::make_shared<File>(account_), EventEntryType::File);
}

void Tree::createFolder(StorageIRI const& iri)
{
    create(iri, Folder::create(), EventEntryType::Folder);
}

ExistenceType Tree::exists(StorageIRI const& iri) const
{
    std::lock_guard const lock(mutex_);
    std::optional<Place> const place = tryFind(iri);
    if (!place || place->node == nullptr)
        return ExistenceType::AsNeither;
    return asFile(place->node) != nullptr ? ExistenceType::AsFile : ExistenceType::AsFolder;
}

void Tree::removeFile(StorageIRI const& iri)
{
    Node removed;
    {
        std::lock_guard const lock(mutex_);
        findFile(iri);
        Place const place = find(iri);
        requireWritable(*place.parent, iri);
        removed = place.parent->take(place.name);
    }
    notify(Kind::Removed, iri, EventEntryType::File);
}

void Tree::removeFolder(StorageIRI const& iri, Removal removal)
{
    Node removed; // goes after the lock: what lies in a folder may take its time to go
    {
        std::lock_guard const lock(mutex_);
        Folder& folder = *findFolder(iri);
        Place const place = find(iri);
        if (place.parent == nullptr)
            throw Exception(ErrorCode::ResourceInUse, iri);
        requireWritable(*place.parent, iri);
        if (removal == Removal::EmptyFolder && !folder.children().empty())
            throw Exception(ErrorCode::FolderNotEmpty, iri);
        std::vector<Folder*> const folders = foldersFrom(folder);
        if (std::any_of(folders.begin(), folders.end(), isProtected))
            throw Exception(ErrorCode::PermissionDenied, iri);
        removed = place.parent->take(place.name);
        std::for_each(folders.begin(), folders.end(), [](Folder* gone) { gone->noteRemoval(); });
    }
    notify(Kind::Removed, iri, EventEntryType::Folder);
}

Status Tree::fileStatus(StorageIRI const& iri) const
{
    std::lock_guard const lock(mutex_);
    return findFile(iri)->status();
}

Status Tree::folderStatus(StorageIRI const& iri) const
{
    std::lock_guard const lock(mutex_);
    return findFolder(iri)->status();
}

template <typename Change>
void Tree::changeAttributes(StorageIRI const& iri, Change const& change)
{
    EventEntryType type = EventEntryType::File;
    {
        std::lock_guard const lock(mutex_);
        Place const place = find(iri);
        if (place.node == nullptr)
            throw Exception(ErrorCode::ResourceNotFound, iri);
        if (asFolder(place.node) != nullptr)
            type = EventEntryType::Folder;
        std::visit(change, *place.node);
    }
    notify(Kind::AttributesChanged, iri, type);
}

void Tree::setLastModified(StorageIRI const& iri, boost::posix_time::ptime const& time)
{
    changeAttributes(iri, [&](auto const& entry) { entry->setLastModified(time); });
}

void Tree::setWritable(StorageIRI const& iri, bool writable)
{
    changeAttributes(iri, [&](auto const& entry) { entry->setWritable(writable); });
}

Content Tree::content(StorageIRI const& iri) const
{
    std::lock_guard const lock(mutex_);
    return findFile(iri)->content();
}

Tree::OpenedFile Tree::open(StorageIRI const& iri, ByteStreamOpenOptions const& options)
{
    FilePtr file;
    bool created = false;
    {
        std::lock_guard const lock(mutex_);
        Place const place = find(iri);
        created = place.node == nullptr && options.create == ByteStreamCreate::Create;
        if (created) {
            requireWritable(*place.parent, iri);
            place.parent->put(place.name, std::make_shared<File>(account_));
        }
        file = findFile(iri);
        if (!file->isWritable())
            throw Exception(ErrorCode::PermissionDenied, iri);
    }
    if (created)
        notify(Kind::Created, iri, EventEntryType::File);
    bool const truncated = options.truncate == ByteStreamTruncate::TruncateExisting && file->truncate();
    return {std::move(file), truncated};
}

FolderPtr Tree::folder(StorageIRI const& iri) const
{
    std::lock_guard const lock(mutex_);
    return findFolder(iri);
}

std::optional<FoundEntry> Tree::advance(Cursor& cursor) const
{
    std::lock_guard const lock(mutex_);
    Folder const& folder = *cursor.folder;
    if (folder.isRemoved())
        return std::nullopt;
    Folder::Children const& children = folder.children();
    if (cursor.version != folder.version()) {
        cursor.next = cursor.last ? children.upper_bound(*cursor.last) : children.begin();
        cursor.version = folder.version();
    }
    if (cursor.next == children.end())
        return std::nullopt;
    auto const& [name, node] = *cursor.next;
    FoundEntry found{name, node, std::visit([](auto const& entry) { return entry->status(); }, node)};
    cursor.last = name;
    ++cursor.next;
    return found;
}

void Tree::notify(Kind kind, StorageIRI const& iri, EventEntryType type) noexcept
{
    notify(kind, iri, iri, type);
}

void Tree::notify(Kind kind, StorageIRI const& from, StorageIRI const& to, EventEntryType type) noexcept
{
    if (subscriptions_.isEmpty())
        return;
    try {
        subscriptions_.publish(Change{kind, type, canonicalPath(from), canonicalPath(to)}, root_);
    } catch (...) {
        // Without memory to tell it, the change stays untold; the operation has succeeded.
    }
}

} // namespace foundation::storage::memory::detail
