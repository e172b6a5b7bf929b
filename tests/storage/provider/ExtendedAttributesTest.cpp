#include <storage/provider/ExtendedAttributes.hpp>

#include <gtest/gtest.h>

#include <map>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

namespace foundation::storage::provider {
namespace {

using Map = std::map<std::string, boost::any>;

static_assert(std::is_constructible_v<ExtendedAttributes, Map>);
static_assert(!std::is_convertible_v<Map, ExtendedAttributes>);
static_assert(std::is_same_v<decltype(std::declval<ExtendedAttributes&>().begin()), Map::iterator>);
static_assert(std::is_same_v<decltype(std::declval<ExtendedAttributes&>().end()), Map::iterator>);
static_assert(std::is_same_v<decltype(std::declval<ExtendedAttributes const&>().begin()), Map::const_iterator>);
static_assert(std::is_same_v<decltype(std::declval<ExtendedAttributes const&>().end()), Map::const_iterator>);
static_assert(std::is_same_v<decltype(&ExtendedAttributes::hasAttribute),
                             bool (ExtendedAttributes::*)(std::string const&) const>);
static_assert(std::is_same_v<decltype(&ExtendedAttributes::getAttribute),
                             boost::any (ExtendedAttributes::*)(std::string const&) const>);

std::string messageFor(ExtendedAttributes const& attributes, std::string const& name)
{
    try {
        attributes.getAttribute(name);
    } catch (std::out_of_range const& error) {
        return error.what();
    }
    return "nothing was thrown";
}

TEST(ExtendedAttributes, IsEmptyByDefault)
{
    ExtendedAttributes const attributes;
    EXPECT_TRUE(attributes.begin() == attributes.end());
    EXPECT_FALSE(attributes.hasAttribute("size"));
}

TEST(ExtendedAttributes, HoldsTheValuesGiven)
{
    ExtendedAttributes const attributes(Map{{"owner", std::string("root")}, {"links", 2}});
    EXPECT_TRUE(attributes.hasAttribute("owner"));
    EXPECT_FALSE(attributes.hasAttribute("Owner"));
    EXPECT_EQ(boost::any_cast<std::string>(attributes.getAttribute("owner")), "root");
    EXPECT_EQ(boost::any_cast<int>(attributes.getAttribute("links")), 2);
}

TEST(ExtendedAttributes, IsWalkedInNameOrder)
{
    ExtendedAttributes const attributes(Map{{"b", 2}, {"a", 1}, {"C", 0}});
    std::vector<std::string> names;
    for (auto const& [name, value] : attributes)
        names.push_back(name);
    EXPECT_EQ(names, (std::vector<std::string>{"C", "a", "b"}));
}

TEST(ExtendedAttributes, ValuesCanBeChangedInPlace)
{
    ExtendedAttributes attributes(Map{{"links", 2}});
    attributes.begin()->second = 3;
    EXPECT_EQ(boost::any_cast<int>(attributes.getAttribute("links")), 3);
}

TEST(ExtendedAttributes, ValueIsACopy)
{
    ExtendedAttributes const attributes(Map{{"links", 2}});
    boost::any value = attributes.getAttribute("links");
    value = 5;
    EXPECT_EQ(boost::any_cast<int>(attributes.getAttribute("links")), 2);
}

TEST(ExtendedAttributes, MissingNameIsNamedAsGiven)
{
    EXPECT_EQ(messageFor(ExtendedAttributes(), "size"), "Attribute size not found.");
    EXPECT_EQ(messageFor(ExtendedAttributes(), ""), "Attribute  not found.");
    EXPECT_EQ(messageFor(ExtendedAttributes(), " \"caf\xC3\xA9\" "), "Attribute  \"caf\xC3\xA9\"  not found.");
}

} // namespace
} // namespace foundation::storage::provider
