// What a provider answers where it does not override an operation.

#include <storage/provider/IProvider.hpp>

#include <fl/i18n/case.hpp>
#include <foundation/ustring.hpp>
#include <storage/provider/ChangeEventExceptions.hpp>
#include <storage/provider/Exception.hpp>

namespace foundation::storage::provider {

namespace {

[[noreturn]] void refuse(StorageIRI const& iri)
{
    throw Exception(ErrorCode::UnsupportedOperation, iri);
}

bool equalPaths(std::u16string const& a, std::u16string const& b, CaseModifier modifier)
{
    if (modifier != CaseModifier::InSensitive)
        return a == b;
    return ustring::transform(a, &fl::i18n::to_lower) == ustring::transform(b, &fl::i18n::to_lower);
}

} // namespace

IProvider::Listing IProvider::doListAllWildcards(StorageIRI const& folder, std::u16string /*pattern*/) const
{
    return doListAll(folder);
}

IProvider::Listing IProvider::doListFilesWildcards(StorageIRI const& folder, std::u16string /*pattern*/) const
{
    return doListFiles(folder);
}

IProvider::Listing IProvider::doListFoldersWildcards(StorageIRI const& folder, std::u16string /*pattern*/) const
{
    return doListFolders(folder);
}

IProvider::Listing IProvider::doListAllNamesOnly(StorageIRI const& folder) const
{
    return doListAll(folder);
}

IProvider::Listing IProvider::doListAllNamesOnlyWildcards(StorageIRI const& folder, std::u16string /*pattern*/) const
{
    return doListAllNamesOnly(folder);
}

IProvider::Listing IProvider::doListFoldersNamesOnly(StorageIRI const& folder) const
{
    return doListFolders(folder);
}

IProvider::Listing IProvider::doListFoldersNamesOnlyWildcards(StorageIRI const& folder,
                                                              std::u16string /*pattern*/) const
{
    return doListFoldersNamesOnly(folder);
}

IProvider::Listing IProvider::doListFilesNamesOnly(StorageIRI const& folder) const
{
    return doListFiles(folder);
}

IProvider::Listing IProvider::doListFilesNamesOnlyWildcards(StorageIRI const& folder, std::u16string /*pattern*/) const
{
    return doListFilesNamesOnly(folder);
}

IProvider::Listing IProvider::doListAllRecursive(StorageIRI const& folder) const
{
    refuse(folder);
}

IProvider::Listing IProvider::doListAllRecursiveWildcards(StorageIRI const& folder, std::u16string /*pattern*/) const
{
    return doListAllRecursive(folder);
}

IProvider::Listing IProvider::doListAllRecursiveNamesOnly(StorageIRI const& folder) const
{
    return doListAllRecursive(folder);
}

IProvider::Listing IProvider::doListAllRecursiveNamesOnlyWildcards(StorageIRI const& folder,
                                                                   std::u16string /*pattern*/) const
{
    return doListAllRecursiveNamesOnly(folder);
}

void IProvider::doRemoveFolderRecursively(StorageIRI const& iri) const
{
    refuse(iri);
}

TransactionStatus IProvider::doCopyFileAtomic(StorageIRI const& from, StorageIRI const& /*to*/,
                                              ReplacementPolicy const& /*policy*/, Interrupt const& /*interrupt*/) const
{
    refuse(from);
}

void IProvider::doSetLastModified(StorageIRI const& iri, boost::posix_time::ptime const& /*time*/) const
{
    refuse(iri);
}

void IProvider::doSetWritable(StorageIRI const& iri, bool /*writable*/) const
{
    refuse(iri);
}

void IProvider::doPublishFolderEventsFor(StorageIRI const& folder, ChangeEventCallback const& /*callback*/,
                                         EventKinds const& /*kinds*/) const
{
    throw ChangeEventsNotSupportedException(folder);
}

void IProvider::doPublishFileEventsFor(StorageIRI const& file, ChangeEventCallback const& /*callback*/,
                                       EventKinds const& /*kinds*/) const
{
    throw ChangeEventsNotSupportedException(file);
}

void IProvider::doStopPublishingEventsFor(StorageIRI const& /*folder*/) const {}

bool IProvider::doHasFeature(ExtendedFeature const& /*feature*/) const
{
    return false;
}

PathComparator IProvider::doGetPathComparator(StorageIRI const& /*iri*/) const
{
    return equalPaths;
}

StorageIRI IProvider::doGetCanonicalLocation(StorageIRI const& iri) const
{
    return iri.getResolvedIRI();
}

FilenameSensitivity IProvider::doGetFilenameSensitivity(StorageIRI const& /*iri*/) const
{
    return {true, true};
}

void IProvider::doShutdown() {}

ExistenceType IProvider::doExists(StorageIRI const& iri) const
{
    if (doFileExists(iri))
        return ExistenceType::AsFile;
    return doFolderExists(iri) ? ExistenceType::AsFolder : ExistenceType::AsNeither;
}

ExistenceTypeExtended IProvider::doExistsExtended(StorageIRI const& iri) const
{
    if (doFileExists(iri))
        return ExistenceTypeExtended::RegularFile;
    return doFolderExists(iri) ? ExistenceTypeExtended::RegularFolder : ExistenceTypeExtended::None;
}

ExtendedAttributes IProvider::doGetExtendedAttributes(StorageIRI const& /*iri*/) const
{
    return ExtendedAttributes();
}

} // namespace foundation::storage::provider
