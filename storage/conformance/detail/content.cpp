#include <storage/conformance/detail/content.hpp>

#include <foundation/ustring.hpp>
#include <storage/provider/ByteStreamOpenOptions.hpp>

#include <algorithm>
#include <array>
#include <random>
#include <sstream>
#include <stdexcept>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

constexpr ByteStreamOpenOptions replaceContent{ByteStreamAccess::WriteOnly, ByteStreamCreate::Create,
                                               ByteStreamTruncate::TruncateExisting, ByteStreamAppend::Overwrite};

/// Far more than any check makes; a provider that lists a folder in itself goes beyond every limit.
constexpr std::size_t deepest = 30;

void addTo(Tree& tree, StorageItem const& folder, std::u16string const& prefix)
{
    if (static_cast<std::size_t>(std::count(prefix.begin(), prefix.end(), u'/')) > deepest)
        throw std::runtime_error("folders are listed in each other without end");
    IProvider::Listing const listing = folder.listAll();
    for (FolderEntry const& entry : entries(*listing)) {
        StorageItem const item(folder, entry.getName());
        std::u16string const path = prefix + entry.getName();
        if (!entry.isFile()) {
            tree[path + u'/'];
            if (item.existsExtended() != ExistenceTypeExtended::SymlinkToFolder)
                addTo(tree, item, path + u'/');
        } else if (item.fileExists()) {
            tree[path] = readFile(item);
        } else {
            tree[path] = "(a broken link)";
        }
    }
}

std::string abbreviated(std::string const& content)
{
    constexpr std::size_t shown = 40;
    std::ostringstream text;
    text << content.size() << " bytes";
    if (content.size() <= shown)
        text << ", \"" << content << '"';
    return text.str();
}

void name(std::ostream& text, char const* what, std::u16string const& path)
{
    text << "\n  " << what << " \"";
    ustring::insert(text, path) << '"';
}

} // namespace

std::string readAll(ByteStream& stream)
{
    std::string content;
    std::array<char, 32 * 1024> buffer;
    for (;;) {
        long const count = stream.read(buffer.data(), static_cast<long>(buffer.size()));
        if (count == -1)
            return content;
        if (count < 1 || count > static_cast<long>(buffer.size()))
            throw std::runtime_error("read answered " + std::to_string(count));
        content.append(buffer.data(), static_cast<std::size_t>(count));
    }
}

void writeAll(ByteStream& stream, std::string_view content)
{
    while (!content.empty()) {
        long const count = stream.write(content.data(), static_cast<long>(content.size()));
        if (count < 1 || count > static_cast<long>(content.size()))
            throw std::runtime_error("write answered " + std::to_string(count));
        content.remove_prefix(static_cast<std::size_t>(count));
    }
}

std::string readFile(StorageItem const& file)
{
    return readAll(*file.openReadOnlyStream());
}

void writeFile(StorageItem const& file, std::string_view content)
{
    auto const stream = file.openStream(replaceContent);
    writeAll(*stream, content);
    stream->close();
}

void makeTree(StorageItem const& folder, Tree const& content)
{
    for (auto const& [path, bytes] : content) {
        if (path.ends_with(u'/'))
            StorageItem(folder, path.substr(0, path.size() - 1)).createFolder();
        else
            writeFile(StorageItem(folder, path), bytes);
    }
}

Tree readTree(StorageItem const& folder)
{
    Tree tree;
    addTo(tree, folder, {});
    return tree;
}

std::string someContent(std::size_t count, unsigned seed)
{
    std::minstd_rand random(seed);
    std::string content(count, '\0');
    std::generate(content.begin(), content.end(), [&] { return static_cast<char>(random() >> 8); });
    return content;
}

std::string difference(Tree const& expected, Tree const& actual)
{
    std::ostringstream text;
    for (auto const& [path, content] : expected) {
        auto const found = actual.find(path);
        if (found == actual.end()) {
            name(text, "missing:", path);
        } else if (found->second != content) {
            name(text, "changed:", path);
            text << ": " << abbreviated(found->second) << ", expected " << abbreviated(content);
        }
    }
    for (auto const& [path, content] : actual) {
        if (!expected.contains(path))
            name(text, "unexpected:", path);
    }
    return text.str();
}

} // namespace foundation::storage::conformance::detail
