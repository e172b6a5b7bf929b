#include <storage/local/LocalProvider.hpp>
#include <storage/provider.hpp>

#include <cstdlib>
#include <iostream>
#include <memory>

namespace provider = foundation::storage::provider;

// Exits with 0 when the folder that the argument names as an IRI is found by the installed libraries, and something
// that it does not hold is not.
int main(int argc, char** argv)
{
    if (argc != 2)
        return EXIT_FAILURE;
    std::string const text = argv[1];
    provider::StorageIRI const location(std::u16string(text.begin(), text.end()));
    auto const local = std::make_shared<foundation::storage::local::LocalProvider>();
    provider::StorageItem const folder(local, location);
    provider::StorageItem const missing(folder, u"missing");
    std::cout << location << '\n';
    return folder.folderExists() && !missing.fileExists() && !missing.folderExists() ? EXIT_SUCCESS : EXIT_FAILURE;
}
