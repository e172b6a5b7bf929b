#include <storage/conformance/detail/listings.hpp>

#include <algorithm>

namespace foundation::storage::conformance::detail {

using provider::FolderEntry;
using provider::IProvider;
using provider::StorageIRI;

std::array<ListingOperation, 8> const listingOperations{{
    {"listAll", &IProvider::listAll, true, true, true, false},
    {"listFiles", &IProvider::listFiles, true, false, true, false},
    {"listFolders", &IProvider::listFolders, false, true, true, false},
    {"listAllNamesOnly", &IProvider::listAllNamesOnly, true, true, false, false},
    {"listFilesNamesOnly", &IProvider::listFilesNamesOnly, true, false, false, false},
    {"listFoldersNamesOnly", &IProvider::listFoldersNamesOnly, false, true, false, false},
    {"listAllRecursive", &IProvider::listAllRecursive, true, true, true, true},
    {"listAllRecursiveNamesOnly", &IProvider::listAllRecursiveNamesOnly, true, true, false, true},
}};

namespace {

/// The last component of a path, with the '/' of a folder.
std::u16string_view lastName(std::u16string_view path)
{
    std::size_t const slash = path.substr(0, path.size() - 1).rfind(u'/');
    return path.substr(slash == path.npos ? 0 : slash + 1);
}

bool ofTheKind(ListingOperation const& operation, std::u16string_view path)
{
    return path.ends_with(u'/') ? operation.folders : operation.files;
}

} // namespace

Tree const& listingContent()
{
    static Tree const content{{u"a.txt", "a"},        {u"b.txt", "bb"},
                              {u"c.md", "ccc"},       {u"empty/", ""},
                              {u"folder.txt/", ""},   {u"folder.txt/deep.txt", "deep"},
                              {u"folder/", ""},       {u"folder/d.txt", "dddd"},
                              {u"folder/inner/", ""}, {u"folder/inner/e.md", "eeeee"}};
    return content;
}

Names expectedNames(ListingOperation const& operation, std::function<bool(std::u16string_view)> const& wanted)
{
    Names names;
    for (auto const& [path, bytes] : listingContent()) {
        std::u16string_view const name = lastName(path);
        std::u16string_view const plain = name.substr(0, name.find(u'/'));
        if ((operation.recursive || name == path) && ofTheKind(operation, path) && wanted(plain))
            names.push_back(path);
    }
    return names;
}

Names expectedNames(ListingOperation const& operation)
{
    return expectedNames(operation, [](std::u16string_view) { return true; });
}

IProvider::Listing list(Scene const& scene, ListingOperation const& operation, StorageIRI const& folder,
                        std::u16string const& pattern)
{
    return (scene.provider().*operation.list)(folder, pattern);
}

Names namesOf(IProvider::Listing const& listing)
{
    Names names;
    for (FolderEntry const& entry : provider::entries(*listing))
        names.push_back(entry.getName() + (entry.isFile() ? u"" : u"/"));
    std::sort(names.begin(), names.end());
    return names;
}

} // namespace foundation::storage::conformance::detail
