#include <tests/storage/local/failures/Scene.hpp>

#include <boost/property_tree/ptree.hpp>

#include <algorithm>
#include <filesystem>
#include <iterator>
#include <sstream>
#include <unistd.h>

namespace foundation::tests::support {

namespace fs = std::filesystem;

namespace {

std::string contentOf(fs::directory_entry const& entry, TemporaryFolder const& folder, std::string const& name)
{
    if (entry.is_symlink())
        return "-> " + fs::read_symlink(entry.path()).native();
    if (entry.is_directory())
        return "/";
    std::ostringstream mode;
    mode << std::oct << static_cast<unsigned>(entry.status().permissions());
    return mode.str() + ": " + folder.read(name);
}

/// Scenes are made by the thousand, which a disk would take minutes for.
fs::path fastFolder()
{
    fs::path const memory = "/dev/shm";
    return ::access(memory.c_str(), W_OK | X_OK) == 0 ? memory : fs::temp_directory_path();
}

} // namespace

Scene::Scene(bool confined) : folder_(fastFolder())
{
    for (char const* const name : {"from", "from/folder", "from/folder/deeper", "from/empty", "to"})
        fs::create_directory(folder_ / name);
    folder_.write("from/file", "0123456789");
    folder_.write("from/long", longContent());
    fs::resize_file(folder_.write("from/sparse", "x"), 1 << 16);
    folder_.write("from/7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak", "of another writer");
    fs::create_directory(folder_ / "from/7e9f4b5e-0000-4000-8000-0123456789ac.tmp.bak");
    folder_.write("from/7e9f4b5e-0000-4000-8000-0123456789ac.tmp.bak/file", "of a move");
    folder_.write("from/folder/inner", "inner");
    folder_.write("from/folder/deeper/innermost", "innermost");
    fs::create_symlink("file", folder_ / "from/link");
    fs::create_symlink("folder", folder_ / "from/link to folder");
    fs::create_symlink("nothing", folder_ / "from/broken link");
    fs::create_hard_link(folder_ / "from/file", folder_ / "from/second name");
    // Bits that no new file has.
    fs::permissions(folder_.write("to/existing", "old"), fs::perms(0672));
    boost::property_tree::ptree settings;
    if (confined)
        settings.put("root", folder_.path().native());
    provider_.configure(settings);
}

Tree Scene::tree() const
{
    Tree tree;
    for (fs::directory_entry const& entry : fs::recursive_directory_iterator(folder_.path())) {
        std::string const name = entry.path().native().substr(folder_.path().native().size() + 1);
        tree[name] = contentOf(entry, folder_, name);
    }
    return tree;
}

std::string const& longContent()
{
    static std::string const content = [] {
        std::string text;
        for (int i = 0; text.size() < 20'000; ++i)
            text += std::to_string(i) + ' ';
        return text;
    }();
    return content;
}

std::size_t openDescriptors()
{
    auto const count = std::distance(fs::directory_iterator("/proc/self/fd"), fs::directory_iterator());
    return static_cast<std::size_t>(count);
}

bool isScratch(std::string const& path)
{
    return path.ends_with(".tmp.bak");
}

} // namespace foundation::tests::support
