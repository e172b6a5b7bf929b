#include <tools/storage/Place.hpp>

#include <fl/filesystem/native_name.hpp>
#include <fl/i18n/utf8.hpp>
#include <tools/storage/schemeText.hpp>

#include <utility>

namespace foundation::storage::tool {

namespace {

std::string childText(std::string text, std::u16string const& name, provider::StorageItem const& item)
{
    if (isIRI(text))
        return fl::i18n::to_utf8(item.getLocation().toString(), fl::i18n::Malformed::Replace);
    if (!text.ends_with('/'))
        text += '/';
    return text + fl::filesystem::to_native_bytes(name);
}

} // namespace

bool isIRI(std::string const& argument)
{
    return schemeLength(argument).has_value();
}

Place::Place(provider::StorageItem item, std::string text) : item_(std::move(item)), text_(std::move(text)) {}

Place::Place(provider::StorageItem item, std::string text, std::shared_ptr<void const> hold)
    : item_(std::move(item)), text_(std::move(text)), hold_(std::move(hold))
{}

bool Place::saysFolder() const
{
    return text_.ends_with('/');
}

Place Place::child(std::u16string const& name) const
{
    provider::StorageItem item(item_, name);
    std::string text = childText(text_, name, item);
    return Place(std::move(item), std::move(text), hold_);
}

} // namespace foundation::storage::tool
