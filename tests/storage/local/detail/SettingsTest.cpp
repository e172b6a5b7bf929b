#include <storage/local/detail/Settings.hpp>

#include <gtest/gtest.h>

#include <tests/support/TemporaryFolder.hpp>

#include <boost/property_tree/ptree.hpp>

#include <stdexcept>
#include <string>
#include <utility>

namespace foundation::storage::local::detail {
namespace {

using boost::property_tree::ptree;
using tests::support::TemporaryFolder;

ptree tree(std::string const& key, std::string const& value)
{
    ptree tree;
    tree.put(key, value);
    return tree;
}

std::string refusalOf(ptree const& tree)
{
    try {
        Settings const settings(tree);
        return "";
    } catch (std::invalid_argument const& error) {
        return error.what();
    }
}

TEST(LocalSettings, AreSafeAndNotConfinedByDefault)
{
    for (Settings const& settings : {Settings(), Settings(ptree())}) {
        EXPECT_EQ(settings.durability, Durability::Full);
        EXPECT_FALSE(settings.root.isConfined());
    }
}

TEST(LocalSettings, TakeEachDurability)
{
    for (auto const& [text, durability] : {std::pair("none", Durability::None), std::pair("file", Durability::File),
                                           std::pair("full", Durability::Full)})
        EXPECT_EQ(Settings(tree("durability", text)).durability, durability);
}

TEST(LocalSettings, TakeWhatCopiesPreserve)
{
    Preserved const nothing = Settings(tree("preserve", "")).preserved;
    EXPECT_FALSE(nothing.times || nothing.extendedAttributes);
    Preserved const times = Settings(tree("preserve", "times")).preserved;
    EXPECT_TRUE(times.times && !times.extendedAttributes);
    Preserved const both = Settings(tree("preserve", "xattrs,times")).preserved;
    EXPECT_TRUE(both.times && both.extendedAttributes);
    for (std::string const text : {"times,", ",times", "Times", "times xattrs"})
        EXPECT_TRUE(refusalOf(tree("preserve", text)).starts_with("preserve: \"")) << text;
}

TEST(LocalSettings, TakeARoot)
{
    TemporaryFolder const folder;
    EXPECT_TRUE(Settings(tree("root", folder.path().native())).root.isConfined());
}

TEST(LocalSettings, NameWhatTheyDoNotUnderstand)
{
    EXPECT_EQ(refusalOf(tree("durability", "Full")), "durability: \"Full\" is neither \"none\", \"file\" nor \"full\"");
    EXPECT_EQ(refusalOf(tree("root", "here")), "root: \"here\" cannot be a root: it is no absolute path");
    EXPECT_EQ(refusalOf(tree("speed", "high")), "speed: not a setting of local files");
    ptree twice = tree("durability", "none");
    twice.add("durability", "full");
    EXPECT_EQ(refusalOf(twice), "durability: stands there twice");
}

} // namespace
} // namespace foundation::storage::local::detail
