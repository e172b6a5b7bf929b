#include <fl/i18n/convert.hpp>
#include <foundation/ustring.hpp>
#include <iostream>
#include <storage/provider.hpp>
#include <storage/registry/registerAll.hpp>

using namespace foundation::storage;

int main(int, char** arguments)
{
    registry::Registry stores;
    registry::registerAll(stores);
    provider::StorageItem const folder = stores.open(fl::i18n::to_ustring(arguments[1])); // such as file:///home/me
    auto const listing = folder.listAll();
    for (provider::FolderEntry const& entry : entries(*listing))
        foundation::ustring::insert(std::cout, entry.getName()) << (entry.isFile() ? "\n" : "/\n");
}
