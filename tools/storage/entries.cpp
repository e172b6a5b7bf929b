#include <tools/storage/entries.hpp>

#include <fl/i18n/utf8.hpp>
#include <nlohmann/json.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/format.hpp>

namespace foundation::storage::tool {

namespace {

std::string toUtf8(std::u16string const& text)
{
    return fl::i18n::to_utf8(text, fl::i18n::Malformed::Replace);
}

} // namespace

Entry bareEntry(Place const& place, Kind kind)
{
    return {place.item().getName(), place.item().getLocation(), kind, {}, {}, {}, {}, {}};
}

Entry describeEntry(Place const& place)
{
    Entry entry = bareEntry(place, existingKindOf(place));
    at(place, [&] {
        if (leadsToFolder(entry.kind)) {
            provider::FolderAttributes const attributes = place.item().getFolderAttributes();
            entry.modified = attributes.getLastModified();
            entry.isWritable = attributes.isWritable();
        } else if (entry.kind != Kind::BrokenSymlink) {
            provider::FileAttributes const attributes = place.item().getFileAttributes();
            entry.size = attributes.getSize();
            entry.modified = attributes.getLastModified();
            entry.isWritable = attributes.isWritable();
        }
    });
    return entry;
}

Entry describeEntry(Place const& place, Kind kind, ListedName const& listed)
{
    Entry entry = bareEntry(place, kind);
    if (kind != Kind::BrokenSymlink) {
        entry.size = listed.size;
        entry.modified = listed.modified;
    }
    return entry;
}

Kind kindOf(Place const& place, ListedName const& listed)
{
    Kind const kind = kindOf(place);
    return kind == Kind::None ? apparentKind(listed) : kind;
}

Kind apparentKind(ListedName const& listed)
{
    return listed.isFile ? Kind::RegularFile : Kind::RegularFolder;
}

std::string toJSON(Entry const& entry)
{
    nlohmann::ordered_json object;
    object["name"] = toUtf8(entry.name);
    object["location"] = toUtf8(entry.location.toString());
    object["type"] = kindName(entry.kind);
    if (entry.depth)
        object["depth"] = *entry.depth;
    if (entry.size)
        object["size"] = *entry.size;
    if (entry.files)
        object["files"] = *entry.files;
    if (entry.modified && !entry.modified->is_special())
        object["modified"] = formatTime(*entry.modified, Precision::Microseconds);
    if (entry.isWritable)
        object["writable"] = *entry.isWritable;
    constexpr int onOneLine = -1;
    constexpr bool inASCII = true;
    return object.dump(onOneLine, ' ', inASCII);
}

} // namespace foundation::storage::tool
