#include <storage/archive/detail/IndexBuilder.hpp>

#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/entryName.hpp>

#include <fl/i18n/convert.hpp>

#include <random>
#include <string>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

namespace {

constexpr std::size_t firstSlots = 64;

std::u16string_view withoutSeparatorsAtTheEnd(std::u16string_view path)
{
    std::size_t const end = path.find_last_not_of(u'/');
    return path.substr(0, end == std::u16string_view::npos ? 0 : end + 1);
}

std::uint64_t randomSeed()
{
    std::random_device device;
    return (std::uint64_t{device()} << 32) | device();
}

} // namespace

IndexBuilder::IndexBuilder(ArchiveLimits const& limits, std::int64_t modified) : limits_(limits), modified_(modified)
{
    index_.seed_ = randomSeed();
    index_.slots_.assign(firstSlots, Index::root);
    Node root;
    root.modified = modified;
    index_.nodes_.push_back(root);
}

void IndexBuilder::add(EntryRecord const& entry)
{
    std::u16string_view path = withoutSeparatorsAtTheEnd(entry.path);
    std::u16string const flat = isDeeper(path, limits_.depth) ? inOneName(path) : std::u16string();
    if (!flat.empty())
        path = flat;
    std::u16string_view name;
    Id const parent = folderOf(path, name);
    bool const isNameless = name.empty() || name == u".";
    if (isNameless && entry.kind == EntryKind::Folder) {
        index_.nodes_[parent].modified = entry.modified;
        return;
    }
    std::u16string const escaped = isSafe(name) ? std::u16string() : safeName(name);
    std::u16string_view const shown = escaped.empty() ? name : std::u16string_view(escaped);
    Id const id = entry.kind == EntryKind::Folder ? addFolder(parent, shown) : addLeaf(parent, shown, entry.kind);
    Node& node = index_.nodes_[id];
    node.modified = entry.modified;
    node.size = entry.kind == EntryKind::Folder ? 0 : entry.size;
    node.locator = entry.locator;
    if (entry.kind != EntryKind::SymbolicLink && entry.kind != EntryKind::HardLink)
        return;
    requireRoom(entry.target.size());
    targetUnits_ += entry.target.size() + sizeof(std::u16string) / sizeof(char16_t);
    node.target = static_cast<std::uint32_t>(index_.targets_.size());
    index_.targets_.emplace_back(entry.target);
    if (entry.kind == EntryKind::HardLink)
        hardLinks_.push_back(id);
}

/// The folder that a path leads to but for its last name, made where it is missing.
IndexBuilder::Id IndexBuilder::folderOf(std::u16string_view path, std::u16string_view& lastName)
{
    std::size_t const slash = path.rfind(u'/');
    std::u16string_view folderPath = path.substr(0, slash == std::u16string_view::npos ? 0 : slash);
    lastName = path.substr(slash == std::u16string_view::npos ? 0 : slash + 1);
    if (folderPath == lastFolderPath_)
        return lastFolder_;
    lastFolderPath_ = folderPath;
    Id folder = Index::root;
    for (std::u16string_view name = takeName(folderPath); !name.empty(); name = takeName(folderPath)) {
        if (name == u".")
            continue;
        folder = isSafe(name) ? enterFolder(folder, name) : enterFolder(folder, safeName(name));
    }
    lastFolder_ = folder;
    return folder;
}

IndexBuilder::Id IndexBuilder::enterFolder(Id parent, std::u16string_view name)
{
    auto const found = index_.child(parent, name);
    return found && index_.at(*found).kind == EntryKind::Folder ? *found : addFolder(parent, name);
}

IndexBuilder::Id IndexBuilder::addFolder(Id parent, std::u16string_view name)
{
    std::size_t const slot = index_.slotOf(parent, name);
    Id const old = index_.slots_[slot];
    if (old != Index::root && index_.at(old).kind == EntryKind::Folder)
        return old;
    Id const id = append(parent, name, EntryKind::Folder);
    replace(slot, parent, id);
    return id;
}

IndexBuilder::Id IndexBuilder::addLeaf(Id parent, std::u16string_view name, EntryKind kind)
{
    std::size_t const slot = index_.slotOf(parent, name);
    Id const old = index_.slots_[slot];
    if (old != Index::root && index_.at(old).kind == EntryKind::Folder)
        return addLeaf(parent, freeName(parent, name), kind);
    Id const id = append(parent, name, kind);
    replace(slot, parent, id);
    return id;
}

/// Gives a name to `id`. Who had it gets another one.
void IndexBuilder::replace(std::size_t slot, Id parent, Id id)
{
    Id const old = std::exchange(index_.slots_[slot], id);
    if (old != Index::root) {
        std::u16string const name = freeName(parent, index_.name(old));
        requireRoom(name.size());
        Node& node = index_.nodes_[old];
        node.nameBegin = static_cast<std::uint32_t>(index_.names_.size());
        node.nameSize = static_cast<std::uint32_t>(name.size());
        index_.names_ += name;
        index_.slots_[index_.slotOf(parent, name)] = old;
    }
    if (index_.nodes_.size() * 2 > index_.slots_.size())
        growSlots();
}

std::u16string IndexBuilder::freeName(Id parent, std::u16string_view name)
{
    std::uint32_t& count = clashes_[{parent, std::u16string(name)}];
    for (;;) {
        std::u16string candidate = std::u16string(name) + u'~' + fl::i18n::to_ustring(std::to_string(++count));
        if (!index_.child(parent, candidate))
            return candidate;
    }
}

IndexBuilder::Id IndexBuilder::append(Id parent, std::u16string_view name, EntryKind kind)
{
    if (index_.nodes_.size() > limits_.entries)
        throw Fault(Reason::TooManyEntries);
    requireRoom(name.size());
    Id const id = static_cast<Id>(index_.nodes_.size());
    Node node;
    node.kind = kind;
    node.modified = modified_;
    node.parent = parent;
    node.nameBegin = static_cast<std::uint32_t>(index_.names_.size());
    node.nameSize = static_cast<std::uint32_t>(name.size());
    index_.names_ += name;
    index_.nodes_.push_back(node);
    Node& folder = index_.nodes_[parent];
    if (folder.lastChild == Node::none)
        folder.firstChild = id;
    else
        index_.nodes_[folder.lastChild].nextSibling = id;
    folder.lastChild = id;
    return id;
}

void IndexBuilder::growSlots()
{
    index_.slots_.assign(index_.slots_.size() * 2, Index::root);
    for (Id id = 1; id != index_.nodes_.size(); ++id)
        index_.slots_[index_.slotOf(index_.at(id).parent, index_.name(id))] = id;
}

/// For one entry more, with so many units of text. Positions of names are counted in 32 bits.
void IndexBuilder::requireRoom(std::size_t units) const
{
    std::size_t const text = index_.names_.size() + targetUnits_ + units;
    std::size_t const bytes = (index_.nodes_.size() + 1) * (sizeof(Node) + 2 * sizeof(Id)) + text * sizeof(char16_t);
    if (bytes > limits_.indexBytes || text > Node::none)
        throw Fault(Reason::IndexTooLarge);
}

Index IndexBuilder::finish()
{
    for (bool const holdsContent : {true, false}) {
        for (Id const link : hardLinks_) {
            if ((index_.at(link).size > 0) == holdsContent)
                resolveHardLink(link);
        }
    }
    return std::move(index_);
}

/// The content may be with any name of a file: with the first, as in a tar, or with the last, as in a cpio.
void IndexBuilder::resolveHardLink(Id link)
{
    auto const found = find(index_.target(link));
    Node& node = index_.nodes_[link];
    bool const leadsToFile = found && *found != link && index_.at(*found).kind == EntryKind::File;
    if (node.size > 0 || leadsToFile)
        node.kind = EntryKind::File;
    if (!leadsToFile)
        return;
    Node& file = index_.nodes_[*found];
    Node const& holder = node.size > 0 ? node : file;
    file.size = node.size = holder.size;
    file.locator = node.locator = holder.locator;
}

/// By the names under which entries are shown, since those in a target are escaped alike.
std::optional<IndexBuilder::Id> IndexBuilder::find(std::u16string_view path) const
{
    if (isDeeper(path, limits_.depth))
        return index_.child(Index::root, safeName(inOneName(path)));
    Id current = Index::root;
    for (std::u16string_view name = takeName(path); !name.empty(); name = takeName(path)) {
        if (name == u".")
            continue;
        auto const found = index_.child(current, isSafe(name) ? std::u16string(name) : safeName(name));
        if (!found)
            return std::nullopt;
        current = *found;
    }
    return current;
}

} // namespace foundation::storage::archive::detail
