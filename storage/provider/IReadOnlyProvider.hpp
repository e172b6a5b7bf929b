#pragma once

#include <foundation/export.hpp>
#include <storage/provider/IProvider.hpp>

namespace foundation::storage::provider {

/// The base of providers over stores that never change: refuses every change at once, before it looks at anything.
///
/// A concrete provider supplies the queries, `doOpenReadOnlyStream` and the three plain listings.
/// Errors: `ReadOnlyProvider`, naming the location given, of two the source. A transactional stream fails so for its
/// scratch location, because that is what it opens first.
class FOUNDATION_API IReadOnlyProvider : public IProvider
{
protected:
    void doCreateFile(StorageIRI const& iri) const override;
    void doCreateFolder(StorageIRI const& iri) const override;
    void doCreateFolderRecursive(StorageIRI const& iri) const override;
    void doRemoveFile(StorageIRI const& iri) const override;
    void doMoveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const override;
    void doRemoveFolder(StorageIRI const& iri) const override;
    void doRemoveFolderRecursively(StorageIRI const& iri) const override;
    void doMoveFolder(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const override;
    std::unique_ptr<ByteStream> doOpenStream(StorageIRI const& iri,
                                             ByteStreamOpenOptions const& options) const override;
    void doCopyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const override;
    void doSetLastModified(StorageIRI const& iri, boost::posix_time::ptime const& time) const override;
    void doSetWritable(StorageIRI const& iri, bool writable) const override;
};

} // namespace foundation::storage::provider
