#pragma once

#include <boost/date_time/posix_time/posix_time_types.hpp>
#include <storage/provider/IFolderEntryIterator.hpp>
#include <tools/storage/Failure.hpp>
#include <tools/storage/Place.hpp>
#include <tools/storage/kinds.hpp>

#include <cstddef>
#include <cstdint>
#include <deque>
#include <memory>
#include <optional>
#include <string>

namespace foundation::storage::tool {

/// What a listing says of an entry; size and time are empty where it was not asked for attributes.
struct ListedName
{
    std::u16string name;
    bool isFile;
    std::optional<std::uint64_t> size = {};
    std::optional<boost::posix_time::ptime> modified = {};
    std::optional<Kind> kind = {}; ///< only where the listing tells
};

ListedName listedNameOf(provider::FolderEntry const& entry);

enum class Listing
{
    NamesOnly,
    WithAttributes,
};

/// One folder of a walk: its listing, and what the walk notes about it.
class FolderLevel
{
public:
    /// Opens the listing; failures name the folder.
    FolderLevel(Place folder, std::optional<Place> counterpart, Listing kind);

    Place const& folder() const { return folder_; }

    /// The folder of another tree that the walk compares or fills; only where it was given.
    Place const& counterpart() const { return *counterpart_; }

    bool hasNext();

    /// Only to be called after `hasNext` has answered true.
    ListedName next();

    bool holdsListing() const { return listing_ != nullptr; }

    /// Reads the rest of the listing into memory and closes it. A failure is kept for when the rest has been taken.
    void release();

    /// Starts the listing again.
    void restart();

    bool isFresh = false;    ///< the counterpart was made by this walk, and held nothing then
    bool hasFailed = false;  ///< something in this folder could not be done
    bool hasChanged = false; ///< something in this folder was removed since the listing started

private:
    std::unique_ptr<provider::IFolderEntryIterator> list() const;
    void advance();
    void close() noexcept;

    Place folder_;
    std::optional<Place> counterpart_;
    Listing kind_;
    std::unique_ptr<provider::IFolderEntryIterator> listing_;
    std::deque<ListedName> rest_;
    std::optional<Failure> failure_;
    bool isEntryTaken_ = false;
};

/// The folders from the start of a walk down to where it is.
///
/// Memory grows with the depth alone, down to 100 levels. Below that the rest of the outermost open listing is kept in
/// memory for each further level, so that the descriptors of deep trees stay bounded.
class FolderStack
{
public:
    explicit FolderStack(Listing kind = Listing::NamesOnly) : kind_(kind) {}

    bool empty() const { return levels_.empty(); }
    std::size_t depth() const { return levels_.size(); }
    FolderLevel& innermost() { return levels_.back(); }
    FolderLevel const& innermost() const { return levels_.back(); }

    void enter(Place folder, std::optional<Place> counterpart = std::nullopt);
    void leave() { levels_.pop_back(); }

private:
    Listing kind_;
    std::deque<FolderLevel> levels_;
};

} // namespace foundation::storage::tool
