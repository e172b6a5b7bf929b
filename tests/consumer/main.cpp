#include <storage/provider.hpp>
#include <storage/registry/registerAll.hpp>

#include <cstdlib>
#include <iostream>

using namespace foundation::storage;

// Exits with 0 when the folder that the argument names as an IRI is found by the installed libraries, and something
// that it does not hold is not.
int main(int argc, char** argv)
{
    if (argc != 2)
        return EXIT_FAILURE;
    std::string const text = argv[1];
    registry::Registry stores;
    registry::registerAll(stores);
    provider::StorageItem const folder = stores.open(std::u16string(text.begin(), text.end()));
    provider::StorageItem const missing(folder, u"missing");
    std::cout << folder.getLocation() << '\n';
    return folder.folderExists() && !missing.fileExists() && !missing.folderExists() ? EXIT_SUCCESS : EXIT_FAILURE;
}
