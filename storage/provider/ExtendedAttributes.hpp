#pragma once

#include <foundation/export.hpp>

#include <boost/any.hpp>

#include <map>
#include <string>

namespace foundation::storage::provider {

/// Named values that a provider knows of a file or folder beyond the common attributes, in name order.
class FOUNDATION_API ExtendedAttributes
{
public:
    using Map = std::map<std::string, boost::any>;
    using iterator = Map::iterator;
    using const_iterator = Map::const_iterator;

    ExtendedAttributes() = default;
    explicit ExtendedAttributes(Map attributes);

    iterator begin() { return attributes_.begin(); }
    iterator end() { return attributes_.end(); }
    const_iterator begin() const { return attributes_.begin(); }
    const_iterator end() const { return attributes_.end(); }

    bool hasAttribute(std::string const& name) const;

    /// A copy of the value; throws `std::out_of_range` "Attribute <name> not found." when there is none.
    boost::any getAttribute(std::string const& name) const;

private:
    Map attributes_;
};

} // namespace foundation::storage::provider
