#pragma once

#include <tools/storage/Place.hpp>
#include <tools/storage/Progress.hpp>
#include <tools/storage/Stores.hpp>
#include <tools/storage/TreeCursor.hpp>

#include <cstdint>
#include <stop_token>
#include <thread>
#include <vector>

namespace foundation::storage::tool {

/// Counts, in a thread of its own, the files and bytes that are to be copied, and tells a progress of them.
///
/// What cannot be looked at counts for nothing: whoever copies it will complain. Memory grows with the depth alone.
/// Threads: belongs to the one that made it; the stores are used by the other at the same time.
class TreeCounter
{
public:
    /// Starts to count: of a place that is a folder all that is below it.
    TreeCounter(Stores const& stores, std::vector<Place> places, Progress& progress);

    /// Stops counting.
    ~TreeCounter() = default;
    TreeCounter(TreeCounter const&) = delete;
    TreeCounter& operator=(TreeCounter const&) = delete;

private:
    void count(std::stop_token const& stop);
    void countPlace(Place const& place, std::stop_token const& stop);
    void countBelow(Place const& folder, std::stop_token const& stop);
    bool countNext(TreeCursor& tree);
    void add(std::uint64_t bytes);

    Stores const& stores_;
    std::vector<Place> places_;
    Progress& progress_;
    Amount found_;
    std::jthread thread_;
};

} // namespace foundation::storage::tool
