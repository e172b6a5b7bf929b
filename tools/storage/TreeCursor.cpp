#include <tools/storage/TreeCursor.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/provider/Exception.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/entries.hpp>
#include <tools/storage/physicalPath.hpp>

#include <unistd.h>
#include <utility>
#include <vector>

namespace foundation::storage::tool {

namespace {

/// Asks the store for each folder by its location.
class StoreCursor final : public TreeCursor
{
public:
    StoreCursor(Place const& folder, Listing listing) : levels_(listing) { levels_.enter(folder); }

    std::optional<ListedName> next() override
    {
        FolderLevel& level = levels_.innermost();
        return level.hasNext() ? std::optional(level.next()) : std::nullopt;
    }

    bool enter(ListedName const& listed) override
    {
        levels_.enter(placeOf(listed));
        return true;
    }

    void leave() override { levels_.leave(); }
    std::size_t depth() const override { return levels_.depth() - 1; }
    Kind kindOf(ListedName const& listed) override { return tool::kindOf(placeOf(listed), listed); }
    std::string text() const override { return place().text(); }
    std::string textOf(ListedName const& listed) const override { return placeOf(listed).text(); }
    Place place() const override { return levels_.innermost().folder(); }
    Place placeOf(ListedName const& listed) const override { return levels_.innermost().folder().child(listed.name); }
    Place workingPlace() override { return place(); }
    Place workingPlaceOf(ListedName const& listed) override { return placeOf(listed); }

private:
    FolderStack levels_;
};

/// Locations of places deep down are long and costly: they are made for those who ask.
class LocalCursor final : public TreeCursor
{
public:
    LocalCursor(Stores const& stores, Place const& folder, Listing listing, local::StartLink link)
        : stores_(stores), root_(folder), walk_(at(folder, [&] {
              return std::make_unique<local::FolderWalk>(folder.item().getLocation(), of(listing), link);
          }))
    {}

    std::optional<ListedName> next() override
    {
        std::optional<local::WalkedEntry> entry;
        attempt([&] { entry = walk_->next(); });
        return entry ? std::optional(listedNameOf(std::move(*entry))) : std::nullopt;
    }

    bool enter(ListedName const& listed) override
    {
        bool isInside = false;
        attempt([&] { isInside = walk_->enter(listed.name); });
        if (!isInside)
            return false;
        held_.reset();
        ends_.push_back(path_.size());
        path_.append(path_.empty() ? u"" : u"/").append(listed.name);
        return true;
    }

    /// At the end of the walk there is nothing to go back to.
    void leave() override
    {
        if (ends_.empty())
            return;
        held_.reset();
        try {
            attempt([&] { walk_->leave(); });
        } catch (Failure const&) {
            forgetLevels();
            throw;
        }
        forgetLevels();
    }

    std::size_t depth() const override { return ends_.size(); }
    Kind kindOf(ListedName const& listed) override { return *listed.kind; }
    std::string text() const override { return path_.empty() ? root_.text() : textBelow(path_); }
    std::string textOf(ListedName const& listed) const override { return textBelow(pathOf(listed)); }
    Place place() const override { return path_.empty() ? root_ : root_.child(path_); }
    Place placeOf(ListedName const& listed) const override { return root_.child(pathOf(listed)); }

    Place workingPlace() override
    {
        Held const& held = hold();
        return Place(held.item, text(), held.folder);
    }

    Place workingPlaceOf(ListedName const& listed) override
    {
        Held const& held = hold();
        return Place(provider::StorageItem(held.item, listed.name), textOf(listed), held.folder);
    }

private:
    struct Held
    {
        std::shared_ptr<local::HeldFolder const> folder;
        provider::StorageItem item;
    };

    Held const& hold()
    {
        attempt([&] {
            if (held_)
                return;
            auto const folder = std::make_shared<local::HeldFolder const>(walk_->hold());
            held_.emplace(Held{folder, stores_.itemAt(folder->location())});
        });
        return *held_;
    }

    static local::WalkedDetail of(Listing listing)
    {
        return listing == Listing::NamesOnly ? local::WalkedDetail::Names : local::WalkedDetail::Attributes;
    }

    static ListedName listedNameOf(local::WalkedEntry entry)
    {
        return {std::move(entry.name), !leadsToFolder(entry.type), entry.size, entry.modified, entry.type};
    }

    std::u16string pathOf(ListedName const& listed) const
    {
        return path_.empty() ? listed.name : path_ + u'/' + listed.name;
    }

    /// The text of a place below, of which no location is made where the user wrote a path.
    std::string textBelow(std::u16string const& path) const
    {
        if (isIRI(root_.text()))
            return root_.child(path).text();
        std::string const separator = root_.text().ends_with('/') ? "" : "/";
        return root_.text() + separator + fl::filesystem::to_native_bytes(path);
    }

    /// The walk tells of failures by their locations.
    template <typename Action>
    void attempt(Action const& action)
    {
        try {
            action();
        } catch (provider::Exception const& error) {
            std::u16string const start = root_.item().getLocation().getPath();
            std::u16string const path = error.getStorageIRI().getPath();
            bool const isBelow = path.size() > start.size() && path.starts_with(start);
            std::size_t const skipped = start.size() + (start.ends_with(u'/') ? 0 : 1);
            rethrowAsFailure(isBelow ? root_.child(path.substr(skipped)) : root_);
        } catch (std::exception const&) {
            rethrowAsFailure(root_);
        }
    }

    void forgetLevels()
    {
        while (ends_.size() > walk_->depth()) {
            path_.resize(ends_.back());
            ends_.pop_back();
        }
    }

    Stores const& stores_;
    Place root_;
    std::unique_ptr<local::FolderWalk> walk_;
    std::u16string path_;           ///< from the root to the innermost folder
    std::vector<std::size_t> ends_; ///< how long that was above
    std::optional<Held> held_;
};

bool canHoldFolders()
{
    static bool const answer = ::access("/proc/self/fd", X_OK) == 0;
    return answer;
}

} // namespace

std::unique_ptr<TreeCursor> openTree(Stores const& stores, Place const& folder, Listing listing, local::StartLink link)
{
    if (isLocal(folder) && canHoldFolders())
        return std::make_unique<LocalCursor>(stores, folder, listing, link);
    return std::make_unique<StoreCursor>(folder, listing);
}

} // namespace foundation::storage::tool
