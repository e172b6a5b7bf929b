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

/// An empty text preserves nothing.
Preserved toPreserved(std::string const& text)
{
    Preserved preserved;
    if (text.empty())
        return preserved;
    std::size_t end = 0;
    for (std::size_t start = 0; end != std::string::npos; start = end + 1) {
        end = text.find(',', start);
        std::string const name = text.substr(start, end == std::string::npos ? end : end - start);
        if (name == "times")
            preserved.times = true;
        else if (name == "xattrs")
            preserved.extendedAttributes = true;
        else
            throw std::invalid_argument("preserve: \"" + name + "\" is neither \"times\" nor \"xattrs\"");
    }
    return preserved;
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
        else if (key == "preserve")
            preserved = toPreserved(value.data());
        else if (key == "root")
            root = toRoot(value.data());
        else
            throw std::invalid_argument(key + ": not a setting of local files");
    }
}

} // namespace foundation::storage::local::detail
