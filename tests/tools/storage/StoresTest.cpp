#include <tools/storage/Stores.hpp>

#include <tests/support/TemporaryFolder.hpp>
#include <tools/storage/Failure.hpp>

#include <gtest/gtest.h>

#include <algorithm>

namespace foundation::storage::tool {
namespace {

using tests::support::TemporaryFolder;

TEST(Stores, ServeWhatIsBuiltIn)
{
    Stores const stores;
    std::vector<registry::Scheme> const schemes = stores.registry().schemes();
    for (char16_t const* const name : {u"file", u"mem"})
        EXPECT_EQ(std::count(schemes.begin(), schemes.end(), registry::Scheme{name, registry::SchemeKind::Physical}),
                  1);
}

TEST(Stores, OpenPathsAndIRIsOfLocalFilesInOneStore)
{
    TemporaryFolder const folder;
    Stores const stores;
    provider::StorageItem const byPath = stores.openItem(folder.path().native());
    EXPECT_EQ(stores.openItem("file://" + folder.path().native()), byPath);
    EXPECT_TRUE(stores.openItem(".").hasSameProviderInstance(byPath));
}

TEST(Stores, KeepWhatIsInMemory)
{
    Stores const stores;
    stores.openItem("mem:///a").createFile();
    EXPECT_TRUE(stores.openItem("mem:///a").fileExists());
}

TEST(Stores, TakeAnyArgumentWithoutASchemeForAPath)
{
    Stores const stores;
    for (char const* const path : {"/u:p@h/x", "//u:p@h/x", "./s://u:p@h/x", "/a//u:p@h", "?#", "\xff"})
        EXPECT_EQ(stores.openItem(path).getScheme(), u"file") << path;
}

} // namespace
} // namespace foundation::storage::tool
