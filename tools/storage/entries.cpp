#include <tools/storage/entries.hpp>

#include <fl/filesystem/native_name.hpp>
#include <fl/i18n/utf8.hpp>
#include <nlohmann/json.hpp>
#include <tools/storage/Stores.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/format.hpp>

namespace foundation::storage::tool {

namespace {

std::string toUtf8(std::u16string const& text)
{
    return fl::i18n::to_utf8(text, fl::i18n::Malformed::Replace);
}

/// A JSON text holds no bytes: those outside UTF-8 become what they are in names.
nlohmann::ordered_json toJSON(std::vector<Attribute> const& attributes)
{
    nlohmann::ordered_json object;
    for (auto const& [name, value] : attributes) {
        auto& member = object[toUtf8(fl::filesystem::from_native_bytes(name))];
        if (auto const* const number = std::get_if<std::uint64_t>(&value))
            member = *number;
        else
            member = toUtf8(fl::filesystem::from_native_bytes(std::get<std::string>(value)));
    }
    return object;
}

} // namespace

Entry bareEntry(Place const& place, Kind kind)
{
    return {place.item().getName(), shownLocation(place), kind, {}, {}, {}, {}, {}, {}};
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

Entry describeFully(Place const& place)
{
    Entry entry = describeEntry(place);
    if (entry.kind != Kind::BrokenSymlink)
        entry.attributes = toldAttributes(at(place, [&] { return place.item().getExtendedAttributes(); }));
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
    if (!entry.attributes.empty())
        object["attributes"] = toJSON(entry.attributes);
    constexpr int onOneLine = -1;
    constexpr bool inASCII = true;
    return object.dump(onOneLine, ' ', inASCII);
}

} // namespace foundation::storage::tool
