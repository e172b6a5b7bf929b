#include <tools/storage/Stores.hpp>

#include <fl/filesystem/native_name.hpp>
#include <fl/filesystem/upath.hpp>
#include <fl/i18n/utf8.hpp>
#include <storage/registry/OpenException.hpp>
#include <storage/registry/redactPassword.hpp>
#include <storage/registry/registerAll.hpp>
#include <tools/storage/Failure.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/explain.hpp>
#include <tools/storage/schemeText.hpp>

#include <algorithm>
#include <cerrno>
#include <fmt/format.h>
#include <memory>
#include <new>
#include <stdlib.h>
#include <system_error>
#include <unistd.h>

namespace foundation::storage::tool {

namespace {

using provider::StorageIRI;
using registry::OpenException;

std::string workingDirectory()
{
    std::unique_ptr<char, decltype(&::free)> const folder(::getcwd(nullptr, 0), &::free);
    if (folder == nullptr)
        throw Failure{".", "the working directory: " + std::generic_category().message(errno)};
    return folder.get();
}

/// Joined as bytes, since neither half need be text, with "." and ".." left for the store to follow.
StorageIRI locationOfPath(std::string const& path)
{
    if (path.empty())
        throw Failure{"''", "an empty path names nothing"};
    std::string const absolute = path.front() == '/' ? path : workingDirectory() + '/' + path;
    fl::filesystem::upath const normal(fl::filesystem::from_native_bytes(absolute));
    return StorageIRI(StorageIRI(u"file:///"), normal.string());
}

std::u16string textOfIRI(std::string const& argument)
{
    return fl::i18n::from_utf8(withKnownSchemes(argument), fl::i18n::Malformed::Throw);
}

/// An argument as it may be shown to whoever sees the terminal.
std::string withoutPassword(std::string const& argument)
{
    return fl::filesystem::to_native_bytes(registry::redactPassword(fl::filesystem::from_native_bytes(argument)));
}

std::string explain(OpenException const& error, std::string const& argument)
{
    std::string const scheme = fl::i18n::to_utf8(error.getStorageIRI().getScheme(), fl::i18n::Malformed::Replace);
    switch (error.getReason()) {
    case OpenException::Reason::UnknownScheme:
        return fmt::format("no store serves the scheme '{}' (for a local path, write ./{})", scheme, argument);
    case OpenException::Reason::ContainerNeedsContainer:
        return fmt::format("'{0}' names places in a container, as in {0}:file:///container!/place", scheme);
    case OpenException::Reason::PlainSchemeOfContainer:
        return fmt::format("'{0}' names no places in a container: '/' follows {0}: (for a local path, write ./{1})",
                           scheme, argument);
    case OpenException::Reason::CredentialsInLocation:
        break;
    }
    return "a location must not carry a password";
}

std::string explain(provider::Exception const& error, std::string const& argument)
{
    bool const isInvalid = error.getErrorCode() == provider::ErrorCode::InvalidLocation;
    if (isInvalid && argument.find_first_of("?#") != std::string::npos)
        return "a '?' or '#' that belongs to a name is written %3F or %23";
    return tool::explain(error);
}

/// Of a place that is known by its text alone.
StorageIRI locationOfText(std::string const& text)
{
    return isIRI(text) ? StorageIRI(textOfIRI(text)) : locationOfPath(text);
}

} // namespace

provider::StorageIRI shownLocation(Place const& place)
{
    StorageIRI const location = place.hold() ? locationOfText(place.text()) : place.item().getLocation();
    std::u16string text = location.toString();
    if (!text.starts_with(u"file:"))
        return location;
    std::size_t const length = text.size();
    for (std::size_t dot = text.find(u"/./"); dot != std::u16string::npos; dot = text.find(u"/./"))
        text.erase(dot, 2);
    if (text.ends_with(u"/."))
        text.resize(text.size() - (text == u"file:///." ? 1 : 2));
    return text.size() == length ? location : StorageIRI(text);
}

Stores::Stores()
{
    registry::registerAll(registry_);
    set("file.durability", "none");
}

void Stores::set(char const* setting, char const* value)
{
    settings_.put(setting, value);
    registry_.configure(settings_);
}

void Stores::syncAll()
{
    set("file.durability", "full");
}

void Stores::keepMetadata()
{
    set("file.preserve", "times,xattrs");
}

provider::StorageItem Stores::openItem(std::string const& argument) const
{
    if (!isIRI(argument))
        return registry_.open(locationOfPath(argument));
    std::string const shown = withoutPassword(argument);
    try {
        provider::StorageItem item = registry_.open(textOfIRI(argument));
        keep(item);
        return item;
    } catch (OpenException const& error) {
        throw Failure{shown, explain(error, shown)};
    } catch (provider::Exception const& error) {
        throw Failure{shown, explain(error, argument)};
    } catch (std::bad_alloc const&) {
        throw;
    } catch (std::exception const& error) {
        throw Failure{shown, fmt::format("not a location: {} (for a local path, write ./{})", error.what(), shown)};
    }
}

/// One item keeps the provider of its container, and of those round it.
void Stores::keep(provider::StorageItem const& item) const
{
    if (!item.getLocation().hasInnerIRI())
        return;
    std::lock_guard const lock(mutex_);
    bool const isKept = std::any_of(kept_.begin(), kept_.end(), [&](provider::StorageItem const& other) {
        return other.hasSameProviderInstance(item);
    });
    if (!isKept)
        kept_.push_back(item);
}

bool Stores::hasArchives() const
{
    std::lock_guard const lock(mutex_);
    return !kept_.empty();
}

void Stores::writeArchives()
{
    try {
        registry_.flush();
    } catch (provider::Exception const& error) {
        throw Failure{fl::i18n::to_utf8(error.getStorageIRI().toString(), fl::i18n::Malformed::Replace),
                      tool::explain(error)};
    }
}

} // namespace foundation::storage::tool
