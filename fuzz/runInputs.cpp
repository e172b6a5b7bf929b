/// Runs a fuzz target on each file of the folders that it is given, without libFuzzer.

#include <fuzz/fuzz.hpp>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <sstream>
#include <string>

namespace {

std::string contentOf(std::filesystem::path const& path)
{
    std::ostringstream content;
    content << std::ifstream(path, std::ios::binary).rdbuf();
    return content.str();
}

int runAll(std::filesystem::path const& folder)
{
    int count = 0;
    for (std::filesystem::directory_entry const& input : std::filesystem::directory_iterator(folder)) {
        std::string const bytes = contentOf(input.path());
        LLVMFuzzerTestOneInput(reinterpret_cast<std::uint8_t const*>(bytes.data()), bytes.size());
        ++count;
    }
    return count;
}

} // namespace

int main(int count, char** arguments)
{
    for (int i = 1; i < count; ++i) {
        int const inputs = runAll(arguments[i]);
        std::cout << arguments[i] << ": " << inputs << " inputs\n";
        if (inputs == 0)
            return EXIT_FAILURE;
    }
    return count > 1 ? EXIT_SUCCESS : EXIT_FAILURE;
}
