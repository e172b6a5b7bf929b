#pragma once

#include <storage/provider/IFolderEntryIterator.hpp>

#include <cstddef>
#include <utility>
#include <vector>

namespace foundation::tests::support {

/// A listing of the entries that it is given.
class VectorListing final : public storage::provider::IFolderEntryIterator
{
public:
    explicit VectorListing(std::vector<storage::provider::FolderEntry> entries) : entries_(std::move(entries)) {}

    bool hasEntry() const override { return position_ < entries_.size(); }
    storage::provider::FolderEntry const& entry() const override { return entries_.at(position_); }
    void next() override { ++position_; }
    void reset() override { position_ = 0; }

private:
    std::vector<storage::provider::FolderEntry> entries_;
    std::size_t position_ = 0;
};

} // namespace foundation::tests::support
