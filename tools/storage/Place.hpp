#pragma once

#include <storage/provider/StorageItem.hpp>

#include <memory>
#include <string>

namespace foundation::storage::tool {

/// Whether an argument has a scheme, and so is an IRI; any other is a local path.
bool isIRI(std::string const& argument);

/// An item, together with the text by which the user knows it: an argument, and for what lies below one, the argument
/// and the way down from it.
class Place
{
public:
    Place(provider::StorageItem item, std::string text);

    /// The same, known by its text alone: its location means something while `hold` lives, which copies share.
    Place(provider::StorageItem item, std::string text, std::shared_ptr<void const> hold);

    provider::StorageItem const& item() const { return item_; }

    /// An IRI in UTF-8, or the bytes of a path. Not for a terminal as it is; see `printable`.
    std::string const& text() const { return text_; }

    /// What keeps the location good; empty where nothing has to.
    std::shared_ptr<void const> const& hold() const { return hold_; }

    /// Whether the user said, with a slash at the end, that this is a folder.
    bool saysFolder() const;

    Place child(std::u16string const& name) const;

private:
    provider::StorageItem item_;
    std::string text_;
    std::shared_ptr<void const> hold_;
};

} // namespace foundation::storage::tool
