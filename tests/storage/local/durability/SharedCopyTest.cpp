#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/durability/MountedFileSystem.hpp>

#include <fl/filesystem/native_name.hpp>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <unistd.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::MountedFileSystem;

StorageIRI iriOf(fs::path const& path)
{
    return StorageIRI(StorageIRI(u"file:///"), fl::filesystem::from_native_bytes(path.native()));
}

std::string contentOf(fs::path const& path)
{
    std::ostringstream content;
    content << std::ifstream(path, std::ios::binary).rdbuf();
    return content.str();
}

TEST(SharedCopy, TakesNoSpaceOnXFS)
{
    if (std::string const objection = MountedFileSystem::objection("xfs"); !objection.empty())
        GTEST_SKIP() << objection;
    MountedFileSystem const disk("xfs", 512u << 20);
    std::string const content(32u << 20, 'x');
    std::ofstream(disk.path() / "file", std::ios::binary) << content;
    ::sync();
    auto const before = fs::space(disk.path()).free;
    LocalProvider const provider;
    StorageIRI const file = iriOf(disk.path() / "file");
    provider.copyFile(file, iriOf(disk.path() / "copy"), ReplacementPolicy::Preserve);
    provider.copyFileAtomic(file, iriOf(disk.path() / "atomic copy"), ReplacementPolicy::Preserve, {});
    ::sync();
    EXPECT_LT(before - fs::space(disk.path()).free, content.size() / 16);
    EXPECT_TRUE(contentOf(disk.path() / "copy") == content);
    EXPECT_TRUE(contentOf(disk.path() / "atomic copy") == content);
}

} // namespace
} // namespace foundation::storage::local
