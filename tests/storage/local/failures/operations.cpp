#include <tests/storage/local/failures/operations.hpp>

#include <storage/local/scratchFiles.hpp>

#include <boost/any.hpp>
#include <boost/date_time/posix_time/posix_time_types.hpp>
#include <boost/property_tree/ptree.hpp>

#include <array>
#include <chrono>
#include <memory>
#include <set>
#include <sstream>
#include <utility>

namespace foundation::tests::support {

using namespace storage::provider;

namespace {

using namespace std::chrono_literals;

constexpr char16_t const* scratchName = u"from/7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak";
constexpr char16_t const* scratchFolderName = u"from/7e9f4b5e-0000-4000-8000-0123456789ac.tmp.bak";

std::string stateText(storage::local::ScratchFileState state)
{
    return std::to_string(static_cast<int>(state));
}

/// An operation on one location.
Operation query(std::string name, std::u16string at, std::function<std::string(Scene const&)> run)
{
    Operation operation;
    operation.name = std::move(name);
    operation.from = std::move(at);
    operation.run = std::move(run);
    return operation;
}

/// One that finds nothing.
Operation change(std::string name, std::u16string at, std::function<void(Scene const&)> run)
{
    return query(std::move(name), std::move(at), [run = std::move(run)](Scene const& scene) {
        run(scene);
        return std::string();
    });
}

Operation transfer(std::string name, std::u16string from, std::u16string to, std::function<void(Scene const&)> run)
{
    Operation operation = change(std::move(name), std::move(from), std::move(run));
    operation.to = std::move(to);
    return operation;
}

Operation leaving(Leaves leaves, Operation operation)
{
    operation.leaves = leaves;
    return operation;
}

/// On a file system that cannot rename without replacing.
Operation lackingNoReplace(Operation operation)
{
    operation.name += "BySecondWay";
    operation.lacks = [](SystemCall const& call) { return call.name == "renameat2" && call.numberOfKind == 1; };
    return operation;
}

/// With the folders "from" and "to" as two file systems.
Operation acrossFileSystems(Operation operation)
{
    operation.name += "AcrossFileSystems";
    operation.leaves = Leaves::OneAndPartOfOther;
    operation.lacking = EXDEV;
    operation.lacks = [](SystemCall const& call) {
        return call.name == "renameat2" && call.paths.front().find("/from/") != std::string::npos &&
               call.paths.back().find("/to/") != std::string::npos;
    };
    return operation;
}

Operation copy(std::string name, std::u16string const& from, std::u16string const& to, ReplacementPolicy policy)
{
    Operation operation = transfer(std::move(name), from, to,
                                   [=](Scene const& s) { s.provider().copyFile(s.at(from), s.at(to), policy); });
    operation.blames = Blames::Either; // it names the source whichever end failed
    return operation;
}

Operation copyAtomically(std::string name, std::u16string const& from, std::u16string const& to,
                         ReplacementPolicy policy)
{
    return transfer(std::move(name), from, to,
                    [=](Scene const& s) { s.provider().copyFileAtomic(s.at(from), s.at(to), policy, {}); });
}

/// On a file system that cannot copy by itself.
Operation lackingKernelCopies(Operation operation)
{
    operation.name += "ByReadingAndWriting";
    operation.lacks = [](SystemCall const& call) { return call.name == "ficlone" || call.name == "copy_file_range"; };
    return operation;
}

template <typename... Values>
std::string text(Values const&... values)
{
    std::ostringstream result;
    ((result << values << ' '), ...);
    return result.str();
}

std::string readAll(ByteStream& stream)
{
    std::string content;
    std::array<char, 4096> buffer;
    for (long size; (size = stream.read(buffer.data(), buffer.size())) != -1;)
        content.append(buffer.data(), static_cast<std::size_t>(size));
    return content;
}

template <typename Stream>
void writeAll(Stream& stream, std::string_view content)
{
    while (!content.empty())
        content.remove_prefix(
            static_cast<std::size_t>(stream.write(content.data(), static_cast<long>(content.size()))));
}

std::string allNames(IProvider::Listing const& listing)
{
    std::set<std::string> names;
    for (FolderEntry const& entry : entries(*listing)) {
        std::u16string const name = entry.getName();
        std::string line(name.begin(), name.end());
        line += entry.isFile() ? " file" : " folder";
        if (auto const& attributes = entry.getFileAttributes())
            line += ' ' + std::to_string(attributes->getSize());
        names.insert(std::move(line));
    }
    std::string all;
    for (std::string const& name : names)
        all += name + '\n';
    return all;
}

boost::posix_time::ptime someTime()
{
    return boost::posix_time::ptime(boost::gregorian::date(2001, 2, 3), boost::posix_time::microseconds(4));
}

void writeTransaction(IProvider const& provider, StorageIRI const& target, StreamClosePolicy policy)
{
    auto const stream = provider.openTransactionalStream(target, {});
    writeAll(*stream, longContent());
    stream->close(policy);
}

void writeTransaction(Scene const& scene, std::u16string const& name, StreamClosePolicy policy)
{
    writeTransaction(scene.provider(), scene.at(name), policy);
}

std::unique_ptr<IProvider> providerWithoutSync()
{
    auto provider = std::make_unique<storage::local::LocalProvider>();
    boost::property_tree::ptree settings;
    settings.put("durability", "none");
    provider->configure(settings);
    return provider;
}

void writeWithoutSync(Scene const& scene, std::u16string const& name)
{
    writeTransaction(*providerWithoutSync(), scene.at(name), StreamClosePolicy::Commit);
}

Operation copyWithoutSync(std::string name, std::u16string const& from, std::u16string const& to,
                          ReplacementPolicy policy)
{
    return transfer(std::move(name), from, to,
                    [=](Scene const& s) { providerWithoutSync()->copyFileAtomic(s.at(from), s.at(to), policy, {}); });
}

/// Where files that were made without names stay without.
Operation lackingNewNames(Operation operation)
{
    operation.name += "WithoutNewNames";
    operation.lacking = EPERM;
    operation.lacks = [](SystemCall const& call) { return call.name == "linkat"; };
    return operation;
}

ByteStreamOpenOptions appending()
{
    ByteStreamOpenOptions options;
    options.truncate = ByteStreamTruncate::PreserveExisting;
    options.append = ByteStreamAppend::Append;
    return options;
}

} // namespace

std::vector<Operation> entryOperations()
{
    return {
        change("createFile", u"to/new", [](auto& s) { s.provider().createFile(s.at(u"to/new")); }),
        change("createFolder", u"to/new", [](auto& s) { s.provider().createFolder(s.at(u"to/new")); }),
        leaving(Leaves::SomeEntries, change("createFolderRecursive", u"to/a/b",
                                            [](auto& s) { s.provider().createFolderRecursive(s.at(u"to/a/b")); })),
        query("fileExists", u"from/link", [](auto& s) { return text(s.provider().fileExists(s.at(u"from/link"))); }),
        query("folderExists", u"from/folder",
              [](auto& s) { return text(s.provider().folderExists(s.at(u"from/folder"))); }),
        query("exists", u"from/link", [](auto& s) { return text(s.provider().exists(s.at(u"from/link"))); }),
        query("existsExtended", u"from/link",
              [](auto& s) { return text(s.provider().existsExtended(s.at(u"from/link"))); }),
        query("existsExtendedOfBrokenLink", u"from/broken link",
              [](auto& s) { return text(s.provider().existsExtended(s.at(u"from/broken link"))); }),
        change("removeFile", u"from/file", [](auto& s) { s.provider().removeFile(s.at(u"from/file")); }),
        change("removeFolder", u"from/empty", [](auto& s) { s.provider().removeFolder(s.at(u"from/empty")); }),
        leaving(Leaves::SomeEntries,
                change("removeFolderRecursively", u"from/folder",
                       [](auto& s) { s.provider().removeFolderRecursively(s.at(u"from/folder")); })),
        query("getFileAttributes", u"from/link",
              [](auto& s) {
                  FileAttributes const attributes = s.provider().getFileAttributes(s.at(u"from/link"));
                  return text(attributes.getSize(), attributes.isWritable());
              }),
        query("getFolderAttributes", u"from/folder",
              [](auto& s) { return text(s.provider().getFolderAttributes(s.at(u"from/folder")).isWritable()); }),
        query("getExtendedAttributes", u"from/file",
              [](auto& s) {
                  auto const attributes = s.provider().getExtendedAttributes(s.at(u"from/file"));
                  return text(boost::any_cast<std::uint32_t>(attributes.getAttribute("links")));
              }),
        query("examineScratchFile", scratchName,
              [](auto& s) { return stateText(storage::local::examineScratchFile(s.at(scratchName), 0s)); }),
        query("removeAbandonedScratchFile", scratchName,
              [](auto& s) { return stateText(storage::local::removeAbandonedScratchFile(s.at(scratchName), 0s)); }),
        query("examineScratchFolder", scratchFolderName,
              [](auto& s) { return stateText(storage::local::examineScratchFile(s.at(scratchFolderName), 0s)); }),
        leaving(Leaves::SomeEntries,
                query("removeAbandonedScratchFolder", scratchFolderName,
                      [](auto& s) {
                          return stateText(storage::local::removeAbandonedScratchFile(s.at(scratchFolderName), 0s));
                      })),
        change("setLastModified", u"from/file",
               [](auto& s) { s.provider().setLastModified(s.at(u"from/file"), someTime()); }),
        change("setWritable", u"from/folder", [](auto& s) { s.provider().setWritable(s.at(u"from/folder"), true); }),
    };
}

std::vector<Operation> transferOperations()
{
    using enum ReplacementPolicy;
    auto const move = [](std::string name, std::u16string const& from, std::u16string const& to,
                         ReplacementPolicy policy) {
        return transfer(std::move(name), from, to,
                        [=](Scene const& s) { s.provider().moveFile(s.at(from), s.at(to), policy); });
    };
    auto const moveFolder = [](std::string name, std::u16string const& from, std::u16string const& to,
                               ReplacementPolicy policy) {
        return transfer(std::move(name), from, to,
                        [=](Scene const& s) { s.provider().moveFolder(s.at(from), s.at(to), policy); });
    };
    return {
        acrossFileSystems(move("moveFile", u"from/long", u"to/new", Preserve)),
        acrossFileSystems(move("moveSmallFileReplacing", u"from/file", u"to/existing", Overwrite)),
        acrossFileSystems(move("moveLink", u"from/link", u"to/new", Preserve)),
        acrossFileSystems(move("moveLinkReplacing", u"from/link", u"to/existing", Overwrite)),
        acrossFileSystems(moveFolder("moveFolder", u"from/folder", u"to/new", Preserve)),
        move("moveFile", u"from/file", u"to/new", Preserve),
        lackingNoReplace(move("moveFile", u"from/file", u"to/new", Preserve)),
        move("moveScratchFile", scratchName, u"to/new", NoClobber),
        move("moveFileReplacing", u"from/file", u"to/existing", Overwrite),
        move("moveFileOntoOtherName", u"from/file", u"from/second name", Overwrite),
        move("moveFileOntoItself", u"from/file", u"from/file", Overwrite),
        move("moveLinkOntoItsFile", u"from/link", u"from/file", Overwrite),
        move("moveFileOntoLink", u"from/long", u"from/link", Overwrite),
        moveFolder("moveFolder", u"from/folder", u"to/new", Preserve),
        lackingNoReplace(moveFolder("moveFolder", u"from/folder", u"to/new", Preserve)),
        moveFolder("moveFolderOntoItself", u"from/folder", u"from/folder", Overwrite),
        leaving(Leaves::PartOfContent, copy("copyFile", u"from/long", u"to/new", Preserve)),
        leaving(Leaves::PartOfContent, copy("copyFileReplacing", u"from/long", u"to/existing", Overwrite)),
        copyAtomically("copyFileAtomic", u"from/long", u"to/new", Preserve),
        copyAtomically("copySmallFileAtomic", u"from/file", u"to/new", Preserve),
        copyAtomically("copyFileAtomicReplacing", u"from/long", u"to/existing", Overwrite),
        copyAtomically("copyFileAtomicReplacingLink", u"from/long", u"from/link", Overwrite),
        lackingKernelCopies(copyAtomically("copyFileAtomic", u"from/long", u"to/new", Preserve)),
        copyAtomically("copySparseFileAtomic", u"from/sparse", u"to/new", Preserve),
        copyWithoutSync("copyFileAtomicWithoutSync", u"from/long", u"to/new", Preserve),
        copyWithoutSync("copySmallFileAtomicWithoutSync", u"from/file", u"to/new", Overwrite),
        copyWithoutSync("copyFileAtomicReplacingWithoutSync", u"from/long", u"to/existing", Overwrite),
        lackingNewNames(copyWithoutSync("copyFileAtomicWithoutSync", u"from/long", u"to/new", Preserve)),
        copyAtomically("copyFileAtomicOntoItself", u"from/file", u"from/second name", Overwrite),
        copy("copyFileOntoItself", u"from/file", u"from/second name", Overwrite),
    };
}

std::vector<Operation> streamOperations()
{
    auto const write = [](std::u16string const& name, ByteStreamOpenOptions const& options) {
        return [=](Scene const& s) {
            auto const stream = s.provider().openStream(s.at(name), options);
            writeAll(*stream, "written");
            stream->close();
        };
    };
    return {
        query("read", u"from/long",
              [](auto& s) { return readAll(*s.provider().openReadOnlyStream(s.at(u"from/long"))); }),
        query("seekAndRead", u"from/file",
              [](auto& s) {
                  auto const stream = s.provider().openReadOnlyStream(s.at(u"from/file"));
                  stream->seek(-3, std::ios_base::end);
                  std::string content = readAll(*stream);
                  stream->close();
                  return content;
              }),
        leaving(Leaves::PartOfContent, change("writeNew", u"to/new", write(u"to/new", {}))),
        leaving(Leaves::PartOfContent, change("writeExisting", u"to/existing", write(u"to/existing", {}))),
        leaving(Leaves::PartOfContent, change("append", u"to/existing", write(u"to/existing", appending()))),
        change("commitNew", u"to/new", [](auto& s) { writeTransaction(s, u"to/new", StreamClosePolicy::Commit); }),
        change("commitReplacing", u"to/existing",
               [](auto& s) { writeTransaction(s, u"to/existing", StreamClosePolicy::Commit); }),
        change("commitWithoutSync", u"to/existing", [](auto& s) { writeWithoutSync(s, u"to/existing"); }),
        change("commitReplacingLink", u"from/link",
               [](auto& s) { writeTransaction(s, u"from/link", StreamClosePolicy::Commit); }),
        change("abort", u"to/existing", [](auto& s) { writeTransaction(s, u"to/existing", StreamClosePolicy::Abort); }),
        change(
            "drop", u"to/existing",
            [](auto& s) { writeAll(*s.provider().openTransactionalStream(s.at(u"to/existing"), {}), longContent()); }),
    };
}

std::vector<Operation> listingOperations()
{
    return {
        query("listAll", u"from", [](auto& s) { return allNames(s.provider().listAll(s.at(u"from"))); }),
        query("listFiles", u"from", [](auto& s) { return allNames(s.provider().listFiles(s.at(u"from"))); }),
        query("listFolders", u"from", [](auto& s) { return allNames(s.provider().listFolders(s.at(u"from"))); }),
        query("listAllNamesOnly", u"from",
              [](auto& s) { return allNames(s.provider().listAllNamesOnly(s.at(u"from"))); }),
        query("listMatching", u"from", [](auto& s) { return allNames(s.provider().listAll(s.at(u"from"), u"*l*")); }),
        query("listAllRecursive", u"from",
              [](auto& s) { return allNames(s.provider().listAllRecursive(s.at(u"from"))); }),
        query("listAllRecursiveNamesOnly", u"from",
              [](auto& s) { return allNames(s.provider().listAllRecursiveNamesOnly(s.at(u"from"))); }),
        query("listTwice", u"from/folder",
              [](auto& s) {
                  auto const listing = s.provider().listAllNamesOnly(s.at(u"from/folder"));
                  std::string const first = allNames(listing);
                  listing->reset();
                  return first + allNames(listing);
              }),
    };
}

std::vector<Operation> allOperations()
{
    std::vector<Operation> all;
    for (auto const& some : {entryOperations(), transferOperations(), streamOperations(), listingOperations()})
        all.insert(all.end(), some.begin(), some.end());
    return all;
}

} // namespace foundation::tests::support
