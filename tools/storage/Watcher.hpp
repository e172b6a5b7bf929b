#pragma once

#include <tools/storage/EventQueue.hpp>
#include <tools/storage/Place.hpp>
#include <tools/storage/Session.hpp>

#include <cstddef>
#include <map>
#include <optional>
#include <string>
#include <unordered_map>
#include <unordered_set>
#include <vector>

namespace foundation::storage::tool {

struct WatchOptions
{
    std::vector<std::string> paths;
    std::vector<std::string> kinds; ///< the words of those to print; empty for all
    std::optional<std::size_t> count;
    bool isRecursive = false;
    bool isAll = false;
    bool isJSON = false;
    bool tellsTime = false;
};

/// Prints what happens to files and folders, as it happens.
///
/// Folders below are each watched by themselves. One that appears is watched first and listed then, so that nothing is
/// missed: what is found in it is printed as created, and the event of that is not, if it still comes.
class Watcher
{
public:
    Watcher(Session& session, WatchOptions const& options) : session_(session), options_(options) {}

    /// Begins to watch a file or folder; failures name it.
    void add(Place const& operand);

    /// Prints events until nothing is left to watch, or as many as were asked for are printed.
    void run();

private:
    struct Watch
    {
        std::size_t id;
        Place place;
        bool isFolder;
        bool isOperand;
    };

    enum class Contents
    {
        Old,
        New, ///< to be printed as created
    };

    /// By location, so that what lies below a folder stands together.
    using Watches = std::map<std::u16string, Watch>;

    void addAs(Place const& operand, bool isFolder);
    void subscribe(Place const& place, bool isFolder, bool isOperand);
    bool subscribeBelow(Place const& folder);
    void watchTree(Place const& folder, Contents contents);
    void watchBelow(Place const& folder, Contents contents);
    std::vector<Place> foldersIn(Place const& folder, Contents contents);
    Watches::iterator unsubscribe(Watches::iterator watch);
    void unsubscribeTree(provider::StorageIRI const& folder);

    template <typename Action>
    void attemptUnlessGone(Place const& place, Action const& action);

    void handle(StoreEvent const& event);
    void startAgain();
    void handleEnd(Watch const& watch, StoreEvent const& event);
    void follow(Watch const& watch, StoreEvent const& event);
    bool isRepeated(StoreEvent const& event);
    bool wasFound(StoreEvent const& event);
    bool isWatched(provider::StorageIRI const& folder) const;
    Place placeOf(Watch const& watch, provider::StorageIRI const& location) const;

    void report(Watch const& watch, StoreEvent event);
    void print(events::Kind kind, Place const& place, std::optional<Place> target, events::EntryType type);
    bool isWanted(events::Kind kind) const;
    bool isHidden(provider::StorageIRI const& location) const;
    provider::IProvider::EventKinds kindsToAskFor() const;
    bool isDone() const;

    Session& session_;
    WatchOptions const& options_;
    EventQueue queue_;
    Watches watches_;
    std::unordered_map<std::size_t, std::u16string> locations_; // of watches, by their identifiers
    std::unordered_set<std::u16string> found_;                  // printed as created when their folder was listed
    std::optional<StoreEvent> latest_;
    std::size_t nextId_ = 0;
    std::size_t operandCount_ = 0;
    std::size_t printedCount_ = 0;
};

} // namespace foundation::storage::tool
