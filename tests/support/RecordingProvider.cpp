#include <tests/support/RecordingProvider.hpp>

#include <foundation/ustring.hpp>
#include <storage/provider/detail/GenericTransactionalStream.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/VectorListing.hpp>

#include <boost/date_time/posix_time/time_formatters.hpp>

#include <concepts>
#include <cstddef>
#include <ios>
#include <sstream>

namespace foundation::tests::support {

using namespace storage::provider;
using boost::posix_time::ptime;

namespace {

// How arguments are logged.
template <class Argument>
void write(std::ostream& stream, Argument const& argument)
{
    stream << argument;
}

void write(std::ostream& stream, ExtendedFeature const& feature)
{
    stream << "ExtendedFeature(" << static_cast<int>(feature) << ")";
}

void write(std::ostream& stream, std::u16string const& text)
{
    stream << '"';
    ustring::insert(stream, text) << '"';
}

void write(std::ostream& stream, ptime const& time)
{
    stream << boost::posix_time::to_iso_extended_string(time);
}

template <class Signature>
void write(std::ostream& stream, std::function<Signature> const& function)
{
    stream << (function ? "function" : "no function");
}

void write(std::ostream& stream, IProvider::EventKinds const& kinds)
{
    stream << "{";
    for (storage::events::Kind const kind : kinds)
        stream << " " << static_cast<int>(kind);
    stream << " }";
}

template <class... Arguments>
std::string textOf(std::string const& operation, Arguments const&... arguments)
{
    std::ostringstream text;
    text << operation << "(" << std::boolalpha;
    std::size_t written = 0;
    ((text << (written++ == 0 ? "" : ", "), write(text, arguments)), ...);
    text << ")";
    return text.str();
}

template <class Result>
Result plain()
{
    if constexpr (std::is_void_v<Result>)
        return;
    else if constexpr (std::same_as<Result, FileAttributes>)
        return FileAttributes(0, ptime(), false);
    else if constexpr (std::same_as<Result, FolderAttributes>)
        return FolderAttributes(ptime(), false);
    else if constexpr (std::same_as<Result, std::unique_ptr<ByteStream>>)
        return std::make_unique<RecordingByteStream>();
    else if constexpr (std::same_as<Result, std::unique_ptr<TransactionalStream>>)
        return std::make_unique<storage::provider::detail::GenericTransactionalStream<ByteStream>>(
            std::make_unique<RecordingByteStream>(), [](StreamClosePolicy const&) {});
    else if constexpr (std::same_as<Result, IProvider::Listing>)
        return std::make_unique<VectorListing>(std::vector<FolderEntry>());
    else if constexpr (std::same_as<Result, StorageIRI>)
        return StorageIRI(u"plain://answer/");
    else
        return Result{};
}

} // namespace

void RecordingProvider::throwIfToldTo(std::string const& call) const
{
    if (auto const failure = failures_.find(call); failure != failures_.end())
        std::rethrow_exception(failure->second);
}

std::any const* RecordingProvider::replyTo(std::string const& call) const
{
    auto const reply = replies_.find(call);
    return reply == replies_.end() ? nullptr : &reply->second;
}

template <class Result, class Fallback, class... Arguments>
Result RecordingProvider::reach(std::string const& operation, Fallback const& fallback,
                                Arguments const&... arguments) const
{
    std::string const call = textOf(operation, arguments...);
    log_.push_back(call);
    for (std::string const& key : {call, operation}) {
        throwIfToldTo(key);
        if (std::any const* reply = replyTo(key))
            return std::any_cast<std::function<Result()> const&>(*reply)();
    }
    return fallback();
}

template <class Result, class... Arguments>
Result RecordingProvider::reachPure(std::string const& operation, Arguments const&... arguments) const
{
    return reach<Result>(operation, plain<Result>, arguments...);
}

template <class Result, class Inherited, class... Arguments>
Result RecordingProvider::reachDefaulted(std::string const& operation, Inherited const& inherited,
                                         Arguments const&... arguments) const
{
    auto const fallback = [&] { return untold_ == Untold::AsksIProvider ? inherited() : plain<Result>(); };
    return reach<Result>(operation, fallback, arguments...);
}

void RecordingProvider::doCreateFile(StorageIRI const& iri) const
{
    reachPure<void>("doCreateFile", iri);
}

void RecordingProvider::doCreateFolder(StorageIRI const& iri) const
{
    reachPure<void>("doCreateFolder", iri);
}

void RecordingProvider::doCreateFolderRecursive(StorageIRI const& iri) const
{
    reachDefaulted<void>(
        "doCreateFolderRecursive", [&] { return IProvider::doCreateFolderRecursive(iri); }, iri);
}

bool RecordingProvider::doFileExists(StorageIRI const& iri) const
{
    return reachPure<bool>("doFileExists", iri);
}

bool RecordingProvider::doFolderExists(StorageIRI const& iri) const
{
    return reachPure<bool>("doFolderExists", iri);
}

void RecordingProvider::doRemoveFile(StorageIRI const& iri) const
{
    reachPure<void>("doRemoveFile", iri);
}

void RecordingProvider::doMoveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    reachPure<void>("doMoveFile", from, to, policy);
}

void RecordingProvider::doRemoveFolder(StorageIRI const& iri) const
{
    reachPure<void>("doRemoveFolder", iri);
}

void RecordingProvider::doRemoveFolderRecursively(StorageIRI const& iri) const
{
    reachDefaulted<void>(
        "doRemoveFolderRecursively", [&] { return IProvider::doRemoveFolderRecursively(iri); }, iri);
}

void RecordingProvider::doMoveFolder(StorageIRI const& from, StorageIRI const& to,
                                     ReplacementPolicy const& policy) const
{
    reachPure<void>("doMoveFolder", from, to, policy);
}

FileAttributes RecordingProvider::doGetFileAttributes(StorageIRI const& iri) const
{
    return reachPure<FileAttributes>("doGetFileAttributes", iri);
}

FolderAttributes RecordingProvider::doGetFolderAttributes(StorageIRI const& iri) const
{
    return reachPure<FolderAttributes>("doGetFolderAttributes", iri);
}

std::unique_ptr<ByteStream> RecordingProvider::doOpenStream(StorageIRI const& iri,
                                                            ByteStreamOpenOptions const& options) const
{
    return reachPure<std::unique_ptr<ByteStream>>("doOpenStream", iri, options);
}

std::unique_ptr<ByteStream> RecordingProvider::doOpenReadOnlyStream(StorageIRI const& iri) const
{
    return reachPure<std::unique_ptr<ByteStream>>("doOpenReadOnlyStream", iri);
}

std::unique_ptr<TransactionalStream>
RecordingProvider::doOpenTransactionalStream(StorageIRI const& iri, ByteStreamOpenOptions const& options) const
{
    return reachDefaulted<std::unique_ptr<TransactionalStream>>(
        "doOpenTransactionalStream", [&] { return IProvider::doOpenTransactionalStream(iri, options); }, iri, options);
}

std::unique_ptr<TransactionalStream>
RecordingProvider::doOpenTransactionalStreamAtScratchLocation(StorageIRI const& target, StorageIRI const& scratch,
                                                              ByteStreamOpenOptions const& options) const
{
    return reachDefaulted<std::unique_ptr<TransactionalStream>>(
        "doOpenTransactionalStreamAtScratchLocation",
        [&] { return IProvider::doOpenTransactionalStreamAtScratchLocation(target, scratch, options); }, target,
        scratch, options);
}

IProvider::Listing RecordingProvider::doListAll(StorageIRI const& folder) const
{
    return reachPure<IProvider::Listing>("doListAll", folder);
}

IProvider::Listing RecordingProvider::doListAllWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return reachDefaulted<IProvider::Listing>(
        "doListAllWildcards", [&] { return IProvider::doListAllWildcards(folder, pattern); }, folder, pattern);
}

IProvider::Listing RecordingProvider::doListFiles(StorageIRI const& folder) const
{
    return reachPure<IProvider::Listing>("doListFiles", folder);
}

IProvider::Listing RecordingProvider::doListFilesWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return reachDefaulted<IProvider::Listing>(
        "doListFilesWildcards", [&] { return IProvider::doListFilesWildcards(folder, pattern); }, folder, pattern);
}

IProvider::Listing RecordingProvider::doListFolders(StorageIRI const& folder) const
{
    return reachPure<IProvider::Listing>("doListFolders", folder);
}

IProvider::Listing RecordingProvider::doListFoldersWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return reachDefaulted<IProvider::Listing>(
        "doListFoldersWildcards", [&] { return IProvider::doListFoldersWildcards(folder, pattern); }, folder, pattern);
}

IProvider::Listing RecordingProvider::doListAllNamesOnly(StorageIRI const& folder) const
{
    return reachDefaulted<IProvider::Listing>(
        "doListAllNamesOnly", [&] { return IProvider::doListAllNamesOnly(folder); }, folder);
}

IProvider::Listing RecordingProvider::doListAllNamesOnlyWildcards(StorageIRI const& folder,
                                                                  std::u16string pattern) const
{
    return reachDefaulted<IProvider::Listing>(
        "doListAllNamesOnlyWildcards", [&] { return IProvider::doListAllNamesOnlyWildcards(folder, pattern); }, folder,
        pattern);
}

IProvider::Listing RecordingProvider::doListFoldersNamesOnly(StorageIRI const& folder) const
{
    return reachDefaulted<IProvider::Listing>(
        "doListFoldersNamesOnly", [&] { return IProvider::doListFoldersNamesOnly(folder); }, folder);
}

IProvider::Listing RecordingProvider::doListFoldersNamesOnlyWildcards(StorageIRI const& folder,
                                                                      std::u16string pattern) const
{
    return reachDefaulted<IProvider::Listing>(
        "doListFoldersNamesOnlyWildcards", [&] { return IProvider::doListFoldersNamesOnlyWildcards(folder, pattern); },
        folder, pattern);
}

IProvider::Listing RecordingProvider::doListFilesNamesOnly(StorageIRI const& folder) const
{
    return reachDefaulted<IProvider::Listing>(
        "doListFilesNamesOnly", [&] { return IProvider::doListFilesNamesOnly(folder); }, folder);
}

IProvider::Listing RecordingProvider::doListFilesNamesOnlyWildcards(StorageIRI const& folder,
                                                                    std::u16string pattern) const
{
    return reachDefaulted<IProvider::Listing>(
        "doListFilesNamesOnlyWildcards", [&] { return IProvider::doListFilesNamesOnlyWildcards(folder, pattern); },
        folder, pattern);
}

IProvider::Listing RecordingProvider::doListAllRecursive(StorageIRI const& folder) const
{
    return reachDefaulted<IProvider::Listing>(
        "doListAllRecursive", [&] { return IProvider::doListAllRecursive(folder); }, folder);
}

IProvider::Listing RecordingProvider::doListAllRecursiveWildcards(StorageIRI const& folder,
                                                                  std::u16string pattern) const
{
    return reachDefaulted<IProvider::Listing>(
        "doListAllRecursiveWildcards", [&] { return IProvider::doListAllRecursiveWildcards(folder, pattern); }, folder,
        pattern);
}

IProvider::Listing RecordingProvider::doListAllRecursiveNamesOnly(StorageIRI const& folder) const
{
    return reachDefaulted<IProvider::Listing>(
        "doListAllRecursiveNamesOnly", [&] { return IProvider::doListAllRecursiveNamesOnly(folder); }, folder);
}

IProvider::Listing RecordingProvider::doListAllRecursiveNamesOnlyWildcards(StorageIRI const& folder,
                                                                           std::u16string pattern) const
{
    return reachDefaulted<IProvider::Listing>(
        "doListAllRecursiveNamesOnlyWildcards",
        [&] { return IProvider::doListAllRecursiveNamesOnlyWildcards(folder, pattern); }, folder, pattern);
}

void RecordingProvider::doCopyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    reachDefaulted<void>(
        "doCopyFile", [&] { return IProvider::doCopyFile(from, to, policy); }, from, to, policy);
}

TransactionStatus RecordingProvider::doCopyFileAtomic(StorageIRI const& from, StorageIRI const& to,
                                                      ReplacementPolicy const& policy, Interrupt const& interrupt) const
{
    interruptGiven = interrupt;
    return reachDefaulted<TransactionStatus>(
        "doCopyFileAtomic", [&] { return IProvider::doCopyFileAtomic(from, to, policy, interrupt); }, from, to, policy,
        interrupt);
}

void RecordingProvider::doSetLastModified(StorageIRI const& iri, ptime const& time) const
{
    reachDefaulted<void>(
        "doSetLastModified", [&] { return IProvider::doSetLastModified(iri, time); }, iri, time);
}

void RecordingProvider::doSetWritable(StorageIRI const& iri, bool writable) const
{
    reachDefaulted<void>(
        "doSetWritable", [&] { return IProvider::doSetWritable(iri, writable); }, iri, writable);
}

void RecordingProvider::doPublishFolderEventsFor(StorageIRI const& folder, ChangeEventCallback const& callback,
                                                 EventKinds const& kinds) const
{
    callbackGiven = callback;
    reachDefaulted<void>(
        "doPublishFolderEventsFor", [&] { return IProvider::doPublishFolderEventsFor(folder, callback, kinds); },
        folder, callback, kinds);
}

void RecordingProvider::doPublishFileEventsFor(StorageIRI const& file, ChangeEventCallback const& callback,
                                               EventKinds const& kinds) const
{
    callbackGiven = callback;
    reachDefaulted<void>(
        "doPublishFileEventsFor", [&] { return IProvider::doPublishFileEventsFor(file, callback, kinds); }, file,
        callback, kinds);
}

void RecordingProvider::doStopPublishingEventsFor(StorageIRI const& folder) const
{
    reachDefaulted<void>(
        "doStopPublishingEventsFor", [&] { return IProvider::doStopPublishingEventsFor(folder); }, folder);
}

bool RecordingProvider::doHasFeature(ExtendedFeature const& feature) const
{
    return reachDefaulted<bool>(
        "doHasFeature", [&] { return IProvider::doHasFeature(feature); }, feature);
}

PathComparator RecordingProvider::doGetPathComparator(StorageIRI const& iri) const
{
    return reachDefaulted<PathComparator>(
        "doGetPathComparator", [&] { return IProvider::doGetPathComparator(iri); }, iri);
}

StorageIRI RecordingProvider::doGetCanonicalLocation(StorageIRI const& iri) const
{
    return reachDefaulted<StorageIRI>(
        "doGetCanonicalLocation", [&] { return IProvider::doGetCanonicalLocation(iri); }, iri);
}

FilenameSensitivity RecordingProvider::doGetFilenameSensitivity(StorageIRI const& iri) const
{
    return reachDefaulted<FilenameSensitivity>(
        "doGetFilenameSensitivity", [&] { return IProvider::doGetFilenameSensitivity(iri); }, iri);
}

void RecordingProvider::doShutdown()
{
    reachDefaulted<void>("doShutdown", [&] { return IProvider::doShutdown(); });
}

ExistenceType RecordingProvider::doExists(StorageIRI const& iri) const
{
    return reachDefaulted<ExistenceType>(
        "doExists", [&] { return IProvider::doExists(iri); }, iri);
}

ExistenceTypeExtended RecordingProvider::doExistsExtended(StorageIRI const& iri) const
{
    return reachDefaulted<ExistenceTypeExtended>(
        "doExistsExtended", [&] { return IProvider::doExistsExtended(iri); }, iri);
}

ExtendedAttributes RecordingProvider::doGetExtendedAttributes(StorageIRI const& iri) const
{
    return reachDefaulted<ExtendedAttributes>(
        "doGetExtendedAttributes", [&] { return IProvider::doGetExtendedAttributes(iri); }, iri);
}

} // namespace foundation::tests::support
