#include <storage/provider/IConfigurableProvider.hpp>

#include <utility>

namespace foundation::storage::provider {

void IConfigurableProvider::configure(boost::property_tree::ptree tree)
{
    doConfigure(std::move(tree));
}

} // namespace foundation::storage::provider
