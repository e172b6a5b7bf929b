#include <storage/provider/IReadOnlyProvider.hpp>

#include <storage/provider/Exception.hpp>

namespace foundation::storage::provider {

namespace {

[[noreturn]] void refuse(StorageIRI const& iri)
{
    throw Exception(ErrorCode::ReadOnlyProvider, iri);
}

} // namespace

void IReadOnlyProvider::doCreateFile(StorageIRI const& iri) const
{
    refuse(iri);
}

void IReadOnlyProvider::doCreateFolder(StorageIRI const& iri) const
{
    refuse(iri);
}

void IReadOnlyProvider::doCreateFolderRecursive(StorageIRI const& iri) const
{
    refuse(iri);
}

void IReadOnlyProvider::doRemoveFile(StorageIRI const& iri) const
{
    refuse(iri);
}

void IReadOnlyProvider::doMoveFile(StorageIRI const& from, StorageIRI const& /*to*/,
                                   ReplacementPolicy const& /*policy*/) const
{
    refuse(from);
}

void IReadOnlyProvider::doRemoveFolder(StorageIRI const& iri) const
{
    refuse(iri);
}

void IReadOnlyProvider::doRemoveFolderRecursively(StorageIRI const& iri) const
{
    refuse(iri);
}

void IReadOnlyProvider::doMoveFolder(StorageIRI const& from, StorageIRI const& /*to*/,
                                     ReplacementPolicy const& /*policy*/) const
{
    refuse(from);
}

std::unique_ptr<ByteStream> IReadOnlyProvider::doOpenStream(StorageIRI const& iri,
                                                            ByteStreamOpenOptions const& /*options*/) const
{
    refuse(iri);
}

void IReadOnlyProvider::doCopyFile(StorageIRI const& from, StorageIRI const& /*to*/,
                                   ReplacementPolicy const& /*policy*/) const
{
    refuse(from);
}

void IReadOnlyProvider::doSetLastModified(StorageIRI const& iri, boost::posix_time::ptime const& /*time*/) const
{
    refuse(iri);
}

void IReadOnlyProvider::doSetWritable(StorageIRI const& iri, bool /*writable*/) const
{
    refuse(iri);
}

} // namespace foundation::storage::provider
