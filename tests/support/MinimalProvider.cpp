#include <tests/support/MinimalProvider.hpp>

#include <storage/provider/Exception.hpp>
#include <tests/support/StringByteStream.hpp>
#include <tests/support/VectorListing.hpp>

#include <utility>

namespace foundation::tests::support {

using namespace storage::provider;

namespace {

FileAttributes attributesOf(std::string const& content)
{
    return FileAttributes(content.size(), boost::posix_time::ptime(), true);
}

} // namespace

void MinimalProvider::put(StorageIRI const& file, std::string content) const
{
    files[file] = std::make_shared<std::string>(std::move(content));
}

std::string MinimalProvider::content(StorageIRI const& file) const
{
    return *requireFile(file);
}

void MinimalProvider::doCreateFile(StorageIRI const& iri) const
{
    requireFolder(iri.getParent());
    requireFree(iri);
    put(iri, {});
}

void MinimalProvider::doCreateFolder(StorageIRI const& iri) const
{
    requireFolder(iri.getParent());
    requireFree(iri);
    folders.insert(iri);
}

bool MinimalProvider::doFileExists(StorageIRI const& iri) const
{
    return files.contains(iri);
}

bool MinimalProvider::doFolderExists(StorageIRI const& iri) const
{
    return folders.contains(iri);
}

void MinimalProvider::doRemoveFile(StorageIRI const& iri) const
{
    requireFile(iri);
    files.erase(iri);
}

void MinimalProvider::doMoveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    auto const content = requireFile(from);
    if (policy == ReplacementPolicy::Preserve || policy == ReplacementPolicy::NoClobber || folders.contains(to))
        requireFree(to);
    files[to] = content;
    files.erase(from);
}

void MinimalProvider::doRemoveFolder(StorageIRI const& iri) const
{
    requireFolder(iri);
    if (doListAll(iri)->hasEntry())
        throw Exception(ErrorCode::FolderNotEmpty, iri);
    folders.erase(iri);
}

/// Empty folders only.
void MinimalProvider::doMoveFolder(StorageIRI const& from, StorageIRI const& to,
                                   ReplacementPolicy const& /*policy*/) const
{
    requireFree(to);
    doRemoveFolder(from);
    folders.insert(to);
}

FileAttributes MinimalProvider::doGetFileAttributes(StorageIRI const& iri) const
{
    return attributesOf(*requireFile(iri));
}

FolderAttributes MinimalProvider::doGetFolderAttributes(StorageIRI const& iri) const
{
    requireFolder(iri);
    return FolderAttributes(boost::posix_time::ptime(), true);
}

std::unique_ptr<ByteStream> MinimalProvider::doOpenStream(StorageIRI const& iri,
                                                          ByteStreamOpenOptions const& options) const
{
    if (!files.contains(iri) && options.create == ByteStreamCreate::Create)
        doCreateFile(iri);
    if (options.truncate == ByteStreamTruncate::TruncateExisting)
        requireFile(iri)->clear();
    return std::make_unique<StringByteStream>(requireFile(iri), options.append == ByteStreamAppend::Append);
}

std::unique_ptr<ByteStream> MinimalProvider::doOpenReadOnlyStream(StorageIRI const& iri) const
{
    return std::make_unique<StringByteStream>(requireFile(iri));
}

IProvider::Listing MinimalProvider::doListAll(StorageIRI const& folder) const
{
    std::vector<FolderEntry> entries;
    addFolders(folder, entries);
    addFiles(folder, entries);
    return std::make_unique<VectorListing>(std::move(entries));
}

IProvider::Listing MinimalProvider::doListFiles(StorageIRI const& folder) const
{
    std::vector<FolderEntry> entries;
    addFiles(folder, entries);
    return std::make_unique<VectorListing>(std::move(entries));
}

IProvider::Listing MinimalProvider::doListFolders(StorageIRI const& folder) const
{
    std::vector<FolderEntry> entries;
    addFolders(folder, entries);
    return std::make_unique<VectorListing>(std::move(entries));
}

std::shared_ptr<std::string> const& MinimalProvider::requireFile(StorageIRI const& iri) const
{
    auto const found = files.find(iri);
    if (found == files.end())
        throw Exception(ErrorCode::ResourceNotFound, iri);
    return found->second;
}

void MinimalProvider::requireFolder(StorageIRI const& iri) const
{
    if (!folders.contains(iri))
        throw Exception(ErrorCode::ResourceNotFound, iri);
}

void MinimalProvider::requireFree(StorageIRI const& iri) const
{
    if (files.contains(iri) || folders.contains(iri))
        throw Exception(ErrorCode::ResourceAlreadyExists, iri);
}

void MinimalProvider::addFiles(StorageIRI const& folder, std::vector<FolderEntry>& entries) const
{
    requireFolder(folder);
    for (auto const& [iri, content] : files) {
        if (iri.getParent() == folder)
            entries.emplace_back(iri.getName(), attributesOf(*content));
    }
}

void MinimalProvider::addFolders(StorageIRI const& folder, std::vector<FolderEntry>& entries) const
{
    requireFolder(folder);
    for (StorageIRI const& iri : folders) {
        if (iri.hasParent() && iri.getParent() == folder)
            entries.emplace_back(iri.getName(), FolderAttributes(boost::posix_time::ptime(), true));
    }
}

} // namespace foundation::tests::support
