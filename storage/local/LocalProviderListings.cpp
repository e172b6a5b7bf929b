#include <storage/local/LocalProvider.hpp>

#include <storage/local/detail/LocalListing.hpp>
#include <storage/local/detail/RecursiveListing.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/Selection.hpp>

#include <fl/filesystem/wildcards.hpp>

#include <utility>

namespace foundation::storage::local {

using namespace provider;
using namespace detail;
using fl::filesystem::Wildcards;

IProvider::Listing LocalProvider::list(StorageIRI const& folder, Selection selection) const
{
    return std::make_unique<LocalListing>(root(), folder, std::move(selection));
}

IProvider::Listing LocalProvider::doListAll(StorageIRI const& folder) const
{
    return list(folder, {});
}

IProvider::Listing LocalProvider::doListAllWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list(folder, {.pattern = Wildcards(pattern)});
}

IProvider::Listing LocalProvider::doListFiles(StorageIRI const& folder) const
{
    return list(folder, {.entries = Entries::Files});
}

IProvider::Listing LocalProvider::doListFilesWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list(folder, {.entries = Entries::Files, .pattern = Wildcards(pattern)});
}

IProvider::Listing LocalProvider::doListFolders(StorageIRI const& folder) const
{
    return list(folder, {.entries = Entries::Folders});
}

IProvider::Listing LocalProvider::doListFoldersWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list(folder, {.entries = Entries::Folders, .pattern = Wildcards(pattern)});
}

IProvider::Listing LocalProvider::doListAllNamesOnly(StorageIRI const& folder) const
{
    return list(folder, {.detail = Detail::NamesOnly});
}

IProvider::Listing LocalProvider::doListAllNamesOnlyWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list(folder, {.detail = Detail::NamesOnly, .pattern = Wildcards(pattern)});
}

IProvider::Listing LocalProvider::doListFoldersNamesOnly(StorageIRI const& folder) const
{
    return list(folder, {.entries = Entries::Folders, .detail = Detail::NamesOnly});
}

IProvider::Listing LocalProvider::doListFoldersNamesOnlyWildcards(StorageIRI const& folder,
                                                                  std::u16string pattern) const
{
    return list(folder, {.entries = Entries::Folders, .detail = Detail::NamesOnly, .pattern = Wildcards(pattern)});
}

IProvider::Listing LocalProvider::doListFilesNamesOnly(StorageIRI const& folder) const
{
    return list(folder, {.entries = Entries::Files, .detail = Detail::NamesOnly});
}

IProvider::Listing LocalProvider::doListFilesNamesOnlyWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list(folder, {.entries = Entries::Files, .detail = Detail::NamesOnly, .pattern = Wildcards(pattern)});
}

IProvider::Listing LocalProvider::listRecursively(StorageIRI const& folder, Selection selection) const
{
    return std::make_unique<RecursiveListing>(root(), folder, std::move(selection));
}

IProvider::Listing LocalProvider::doListAllRecursive(StorageIRI const& folder) const
{
    return listRecursively(folder, {});
}

IProvider::Listing LocalProvider::doListAllRecursiveWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return listRecursively(folder, {.pattern = Wildcards(pattern)});
}

IProvider::Listing LocalProvider::doListAllRecursiveNamesOnly(StorageIRI const& folder) const
{
    return listRecursively(folder, {.detail = Detail::NamesOnly});
}

IProvider::Listing LocalProvider::doListAllRecursiveNamesOnlyWildcards(StorageIRI const& folder,
                                                                       std::u16string pattern) const
{
    return listRecursively(folder, {.detail = Detail::NamesOnly, .pattern = Wildcards(pattern)});
}

} // namespace foundation::storage::local
