#pragma once

#include <foundation/export.hpp>
#include <storage/provider/IProvider.hpp>

#include <boost/property_tree/ptree.hpp>

namespace foundation::storage::provider {

/// The base of providers that take settings after they were made; the factories hand theirs on through it.
///
/// A provider that is read-only as well derives from this class alone and refuses changes itself.
class FOUNDATION_API IConfigurableProvider : public IProvider
{
public:
    /// Hands the provider a copy of its own. Which keys there are, and what they mean, is the provider's to say.
    /// Errors: whatever the provider throws, which leaves it as the provider left itself.
    void configure(boost::property_tree::ptree tree);

protected:
    /// Must either take all settings or, when it throws, say what became of them.
    virtual void doConfigure(boost::property_tree::ptree tree) = 0;
};

} // namespace foundation::storage::provider
