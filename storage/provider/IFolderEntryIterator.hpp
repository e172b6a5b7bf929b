#pragma once

#include <storage/provider/FolderEntry.hpp>

#include <cstddef>
#include <iterator>

namespace foundation::storage::provider {

/// A listing of a folder, walked one entry at a time; a fresh one stands on its first entry.
///
/// Memory does not grow with the listing where the provider can avoid it. Not for several threads at once.
class FOUNDATION_API IFolderEntryIterator
{
public:
    /// Whether the listing stands on an entry; false once it is through.
    virtual bool hasEntry() const = 0;

    /// The entry it stands on, valid until the next `next`, `reset` or destruction. Only to be called on an entry.
    virtual FolderEntry const& entry() const = 0;

    /// Goes on to the next entry; throws the provider's error when the store fails. Only to be called on an entry.
    virtual void next() = 0;

    /// Starts again at the first entry of the folder as it is now.
    virtual void reset() = 0;

    virtual ~IFolderEntryIterator() = default;

protected:
    IFolderEntryIterator() = default;
    IFolderEntryIterator(IFolderEntryIterator const&) = default;
    IFolderEntryIterator& operator=(IFolderEntryIterator const&) = default;
};

/// A listing seen as a range; see `entries`.
class FolderEntryRange
{
public:
    class iterator
    {
    public:
        using iterator_concept = std::input_iterator_tag;
        using value_type = FolderEntry;
        using difference_type = std::ptrdiff_t;

        explicit iterator(IFolderEntryIterator& listing) : listing_(&listing) {}

        FolderEntry const& operator*() const { return listing_->entry(); }
        FolderEntry const* operator->() const { return &listing_->entry(); }
        iterator& operator++()
        {
            listing_->next();
            return *this;
        }
        void operator++(int) { listing_->next(); }
        bool operator==(std::default_sentinel_t) const { return !listing_->hasEntry(); }

    private:
        IFolderEntryIterator* listing_;
    };

    explicit FolderEntryRange(IFolderEntryIterator& listing) : listing_(&listing) {}

    iterator begin() const { return iterator(*listing_); }
    std::default_sentinel_t end() const { return {}; }

private:
    IFolderEntryIterator* listing_;
};

/// `for (FolderEntry const& entry : entries(*listing))`, going on from the entry where the listing stands.
/// The listing must outlive the range.
inline FolderEntryRange entries(IFolderEntryIterator& listing)
{
    return FolderEntryRange(listing);
}

} // namespace foundation::storage::provider
