#include <storage/local/detail/Settings.hpp>

#include <boost/property_tree/ptree.hpp>

#include <stdexcept>
#include <string>

namespace foundation::storage::local::detail {

namespace {

using boost::property_tree::ptree;

Durability toDurability(std::string const& text)
{
    if (text == "none")
        return Durability::None;
    if (text == "file")
        return Durability::File;
    if (text == "full")
        return Durability::Full;
    throw std::invalid_argument("durability: \"" + text + "\" is neither \"none\", \"file\" nor \"full\"");
}

Root toRoot(std::string const& path)
{
    try {
        return Root(path);
    } catch (std::invalid_argument const& error) {
        throw std::invalid_argument(std::string("root: ") + error.what());
    }
}

} // namespace

Settings::Settings(ptree const& tree)
{
    for (auto const& [key, value] : tree) {
        if (tree.count(key) > 1)
            throw std::invalid_argument(key + ": stands there twice");
        if (key == "durability")
            durability = toDurability(value.data());
        else if (key == "root")
            root = toRoot(value.data());
        else
            throw std::invalid_argument(key + ": not a setting of local files");
    }
}

} // namespace foundation::storage::local::detail
