#include <storage/provider/ExtendedAttributes.hpp>

#include <stdexcept>
#include <utility>

namespace foundation::storage::provider {

ExtendedAttributes::ExtendedAttributes(Map attributes) : attributes_(std::move(attributes)) {}

bool ExtendedAttributes::hasAttribute(std::string const& name) const
{
    return attributes_.contains(name);
}

boost::any ExtendedAttributes::getAttribute(std::string const& name) const
{
    auto const found = attributes_.find(name);
    if (found == attributes_.end())
        throw std::out_of_range("Attribute " + name + " not found.");
    return found->second;
}

} // namespace foundation::storage::provider
