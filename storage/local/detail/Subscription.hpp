#pragma once

#include <foundation/export.hpp>
#include <storage/local/detail/ChangeDecoder.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/provider/IProvider.hpp>

#include <memory>
#include <optional>
#include <string>

namespace foundation::storage::local::detail {

/// What somebody asked for. A folder is watched; a single entry by the folder that holds it.
struct Interest
{
    std::shared_ptr<Root const> root;
    std::string path;                  ///< of the folder, for `root`
    provider::StorageIRI folder;       ///< as the caller wrote it
    std::optional<std::string> name{}; ///< of the single entry
    provider::StorageIRI subject;      ///< the single entry as the caller wrote it; otherwise the folder
    provider::ChangeEventCallback callback;
    provider::IProvider::EventKinds kinds;
};

/// What a callback is told.
struct Notice
{
    events::Kind kind;
    provider::StorageIRI location;
    provider::StorageIRI second;
    events::EntryType type;
    boost::property_tree::ptree details = {};
};

/// An interest that is being served.
class FOUNDATION_API Subscription
{
public:
    explicit Subscription(Interest interest);

    /// By what it is stopped: the path of the folder, as `folderKey` writes it.
    std::string const& key() const { return key_; }
    provider::StorageIRI const& folder() const { return interest_.folder; }

    /// What the kernel has to look out for.
    std::uint32_t mask() const;

    /// Opens the folder that the path leads to by now; answers 0 or `errno`.
    [[nodiscard]] int openFolder(FileDescriptor& folder) const;

    /// What to tell of a change; nothing if it does not concern this subscription or is of a kind that was not asked
    /// for. `other` is the location of the second watched folder of a move between two.
    std::optional<Notice> noticeOf(FolderChange const& change, provider::StorageIRI const& other) const;

    /// What to tell when the folder is no longer watched.
    std::optional<Notice> noticeOfTheEnd() const;

    void tell(Notice const& notice) const;

    /// Destroys the callback, and what it holds.
    void forget() { interest_.callback = nullptr; }

    // For `Subscriptions` alone, which guards them.
    int watch = -1;
    bool isActive = true;

private:
    bool wants(events::Kind kind) const;
    bool isAbout(WatchedEntry const& entry) const;
    provider::StorageIRI locationOf(WatchedEntry const& entry) const;
    std::optional<events::Kind> kindOf(FolderChange const& change) const;
    std::optional<events::Kind> kindOfArrival() const;
    std::optional<events::Kind> kindOfMove(FolderChange const& change) const;
    std::optional<Notice> noticeOfLoss() const;

    Interest interest_;
    std::string key_;
};

/// The path of a folder in one form: without needless slashes and single dots.
FOUNDATION_API std::string folderKey(std::string const& path);

} // namespace foundation::storage::local::detail
