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

Entry emptyEntry(Place const& place, Kind kind)
{
    return {place.item().getName(), place.item().getLocation(), kind, {}, {}, {}};
}

} // namespace

Entry describeEntry(Place const& place)
{
    Entry entry = emptyEntry(place, existingKindOf(place));
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

Entry describeEntry(Place const& place, Kind kind, provider::FolderEntry const& listed)
{
    Entry entry = emptyEntry(place, kind);
    if (auto const& file = listed.getFileAttributes(); file && kind != Kind::BrokenSymlink) {
        entry.size = file->getSize();
        entry.modified = file->getLastModified();
    } else if (auto const& folder = listed.getFolderAttributes()) {
        entry.modified = folder->getLastModified();
    }
    return entry;
}

std::string toJSON(Entry const& entry)
{
    nlohmann::ordered_json object;
    object["name"] = toUtf8(entry.name);
    object["location"] = toUtf8(entry.location.toString());
    object["type"] = kindName(entry.kind);
    if (entry.size)
        object["size"] = *entry.size;
    if (entry.modified && !entry.modified->is_special())
        object["modified"] = formatTime(*entry.modified, Precision::Microseconds);
    if (entry.isWritable)
        object["writable"] = *entry.isWritable;
    constexpr int onOneLine = -1;
    constexpr bool inASCII = true;
    return object.dump(onOneLine, ' ', inASCII);
}

} // namespace foundation::storage::tool
