#include <storage/registry/FactoryException.hpp>

#include <fl/i18n/convert.hpp>

namespace foundation::storage::registry {

core::except::IException* FactoryException::clone() const
{
    return new FactoryException(*this);
}

void FactoryException::rethrow() const
{
    throw FactoryException(*this);
}

char const* FactoryException::what() const noexcept
{
    return "foundation::storage::registry::FactoryException";
}

std::u16string FactoryException::ToUstringImpl() const
{
    return u"The store of \"" + getStorageIRI().toString() + u"\" failed with " +
           fl::i18n::to_ustring(toString(getErrorCode())) +
           u". What it said is withheld, because it could repeat settings.";
}

} // namespace foundation::storage::registry
