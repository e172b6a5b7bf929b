#include <fl/i18n/convert.hpp>
#include <foundation/ustring.hpp>
#include <iostream>
#include <storage/local/LocalProvider.hpp>
#include <storage/provider.hpp>

using namespace foundation::storage;

int main(int, char** arguments)
{
    provider::StorageIRI const location(fl::i18n::to_ustring(arguments[1])); // such as file:///home/me
    provider::StorageItem const folder(std::make_shared<local::LocalProvider>(), location);
    auto const listing = folder.listAll();
    for (provider::FolderEntry const& entry : entries(*listing))
        foundation::ustring::insert(std::cout, entry.getName()) << (entry.isFile() ? "\n" : "/\n");
}
