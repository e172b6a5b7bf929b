#pragma once

#include <gtest/gtest.h>

#include <storage/local/detail/ScratchFile.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <algorithm>
#include <filesystem>
#include <memory>
#include <string>
#include <unistd.h>
#include <vector>

namespace foundation::storage::local::detail {

inline constexpr auto overwrite = provider::ReplacementPolicy::Overwrite;
inline constexpr auto preserve = provider::ReplacementPolicy::Preserve;

using Names = std::vector<std::string>;

/// A folder for scratch files and their targets.
class ScratchFileTest : public testing::Test
{
protected:
    provider::StorageIRI at(std::u16string const& name) const { return folder.iri(name); }

    /// A scratch file with content.
    std::unique_ptr<ScratchFile> begin(std::u16string const& name, Durability durability = Durability::Full,
                                       std::string const& content = "new") const
    {
        auto scratch = std::make_unique<ScratchFile>(root, at(name), durability);
        EXPECT_EQ(::write(scratch->file().get(), content.data(), content.size()), static_cast<ssize_t>(content.size()));
        return scratch;
    }

    Names names(std::string const& below = "") const
    {
        Names names;
        for (std::filesystem::directory_entry const& entry : std::filesystem::directory_iterator(folder / below))
            names.push_back(entry.path().filename());
        std::sort(names.begin(), names.end());
        return names;
    }

    unsigned modeOf(std::string const& name) const
    {
        return static_cast<unsigned>(std::filesystem::symlink_status(folder / name).permissions());
    }

    Root const root{};
    tests::support::TemporaryFolder const folder;
};

} // namespace foundation::storage::local::detail
