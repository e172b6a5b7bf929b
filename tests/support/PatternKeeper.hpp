#pragma once

#include <tests/support/MinimalProvider.hpp>

#include <string>

namespace foundation::tests::support {

/// Keeps where the text of the last listing pattern stood, to tell a pattern that was moved from one that was copied.
class PatternKeeper : public MinimalProvider
{
public:
    mutable char16_t const* text = nullptr;

protected:
    Listing keep(std::u16string const& pattern) const
    {
        text = pattern.data();
        return nullptr;
    }
    Listing doListAllWildcards(StorageIRI const&, std::u16string p) const override { return keep(p); }
    Listing doListFilesWildcards(StorageIRI const&, std::u16string p) const override { return keep(p); }
    Listing doListFoldersWildcards(StorageIRI const&, std::u16string p) const override { return keep(p); }
    Listing doListAllNamesOnlyWildcards(StorageIRI const&, std::u16string p) const override { return keep(p); }
    Listing doListFilesNamesOnlyWildcards(StorageIRI const&, std::u16string p) const override { return keep(p); }
    Listing doListFoldersNamesOnlyWildcards(StorageIRI const&, std::u16string p) const override { return keep(p); }
    Listing doListAllRecursiveWildcards(StorageIRI const&, std::u16string p) const override { return keep(p); }
    Listing doListAllRecursiveNamesOnlyWildcards(StorageIRI const&, std::u16string p) const override { return keep(p); }
};

} // namespace foundation::tests::support
