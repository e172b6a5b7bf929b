#pragma once

#include <storage/provider/IProvider.hpp>
#include <storage/provider/StorageIRI.hpp>
#include <tests/support/CallLog.hpp>

#include <any>
#include <exception>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <type_traits>
#include <utility>

namespace foundation::tests::support {

/// A provider that logs which virtual operation was reached with which arguments, and answers as it is told.
///
/// A call is logged as, for example, `doMoveFile(s://h/a, s://h/b, ReplacementPolicy::Overwrite)`. Strings are logged
/// in quotes; functions by the text "function", and kept, so that a test can call what the provider was given.
class RecordingProvider : public storage::provider::IProvider
{
public:
    using StorageIRI = storage::provider::StorageIRI;

    /// What an operation that was told nothing does. The pure ones answer plainly in any case.
    enum class Untold
    {
        AnswersPlainly, ///< nothing, false, zero, empty; a stream at its end
        AsksIProvider,  ///< what a provider inherits
    };

    explicit RecordingProvider(CallLog& log, Untold untold = Untold::AsksIProvider) : log_(log), untold_(untold) {}

    /// Has an operation do what `reply` does, whose result must be exactly that of the operation. `call` is the text of
    /// a call as it is logged, or the name of an operation for all its calls; the former goes first.
    template <class Reply>
    void when(std::string const& call, Reply reply)
    {
        using Result = std::invoke_result_t<Reply&>;
        failures_.erase(call);
        replies_[call] = std::function<Result()>(std::move(reply));
    }

    /// Has an operation throw, as `when`.
    template <class Error>
    void fail(std::string const& call, Error error)
    {
        failures_[call] = std::make_exception_ptr(std::move(error));
    }

    mutable storage::provider::ChangeEventCallback callbackGiven;
    mutable Interrupt interruptGiven;

protected:
    void doCreateFile(StorageIRI const& iri) const override;
    void doCreateFolder(StorageIRI const& iri) const override;
    void doCreateFolderRecursive(StorageIRI const& iri) const override;
    bool doFileExists(StorageIRI const& iri) const override;
    bool doFolderExists(StorageIRI const& iri) const override;
    void doRemoveFile(StorageIRI const& iri) const override;
    void doMoveFile(StorageIRI const& from, StorageIRI const& to,
                    storage::provider::ReplacementPolicy const& policy) const override;
    void doRemoveFolder(StorageIRI const& iri) const override;
    void doRemoveFolderRecursively(StorageIRI const& iri) const override;
    void doMoveFolder(StorageIRI const& from, StorageIRI const& to,
                      storage::provider::ReplacementPolicy const& policy) const override;
    storage::provider::FileAttributes doGetFileAttributes(StorageIRI const& iri) const override;
    storage::provider::FolderAttributes doGetFolderAttributes(StorageIRI const& iri) const override;
    std::unique_ptr<storage::provider::ByteStream>
    doOpenStream(StorageIRI const& iri, storage::provider::ByteStreamOpenOptions const& options) const override;
    std::unique_ptr<storage::provider::ByteStream> doOpenReadOnlyStream(StorageIRI const& iri) const override;
    std::unique_ptr<storage::provider::TransactionalStream>
    doOpenTransactionalStream(StorageIRI const& iri,
                              storage::provider::ByteStreamOpenOptions const& options) const override;
    std::unique_ptr<storage::provider::TransactionalStream>
    doOpenTransactionalStreamAtScratchLocation(StorageIRI const& target, StorageIRI const& scratch,
                                               storage::provider::ByteStreamOpenOptions const& options) const override;
    Listing doListAll(StorageIRI const& folder) const override;
    Listing doListAllWildcards(StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListFiles(StorageIRI const& folder) const override;
    Listing doListFilesWildcards(StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListFolders(StorageIRI const& folder) const override;
    Listing doListFoldersWildcards(StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListAllNamesOnly(StorageIRI const& folder) const override;
    Listing doListAllNamesOnlyWildcards(StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListFoldersNamesOnly(StorageIRI const& folder) const override;
    Listing doListFoldersNamesOnlyWildcards(StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListFilesNamesOnly(StorageIRI const& folder) const override;
    Listing doListFilesNamesOnlyWildcards(StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListAllRecursive(StorageIRI const& folder) const override;
    Listing doListAllRecursiveWildcards(StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListAllRecursiveNamesOnly(StorageIRI const& folder) const override;
    Listing doListAllRecursiveNamesOnlyWildcards(StorageIRI const& folder, std::u16string pattern) const override;
    void doCopyFile(StorageIRI const& from, StorageIRI const& to,
                    storage::provider::ReplacementPolicy const& policy) const override;
    storage::provider::TransactionStatus doCopyFileAtomic(StorageIRI const& from, StorageIRI const& to,
                                                          storage::provider::ReplacementPolicy const& policy,
                                                          Interrupt const& interrupt) const override;
    void doSetLastModified(StorageIRI const& iri, boost::posix_time::ptime const& time) const override;
    void doSetWritable(StorageIRI const& iri, bool writable) const override;
    void doPublishFolderEventsFor(StorageIRI const& folder, storage::provider::ChangeEventCallback const& callback,
                                  EventKinds const& kinds) const override;
    void doPublishFileEventsFor(StorageIRI const& file, storage::provider::ChangeEventCallback const& callback,
                                EventKinds const& kinds) const override;
    void doStopPublishingEventsFor(StorageIRI const& folder) const override;
    bool doHasFeature(storage::provider::ExtendedFeature const& feature) const override;
    storage::provider::PathComparator doGetPathComparator(StorageIRI const& iri) const override;
    StorageIRI doGetCanonicalLocation(StorageIRI const& iri) const override;
    storage::provider::FilenameSensitivity doGetFilenameSensitivity(StorageIRI const& iri) const override;
    void doShutdown() override;
    storage::provider::ExistenceType doExists(StorageIRI const& iri) const override;
    storage::provider::ExistenceTypeExtended doExistsExtended(StorageIRI const& iri) const override;
    storage::provider::ExtendedAttributes doGetExtendedAttributes(StorageIRI const& iri) const override;

private:
    void throwIfToldTo(std::string const& call) const;
    std::any const* replyTo(std::string const& call) const;

    template <class Result, class Fallback, class... Arguments>
    Result reach(std::string const& operation, Fallback const& fallback, Arguments const&... arguments) const;
    template <class Result, class... Arguments>
    Result reachPure(std::string const& operation, Arguments const&... arguments) const;
    template <class Result, class Inherited, class... Arguments>
    Result reachDefaulted(std::string const& operation, Inherited const& inherited,
                          Arguments const&... arguments) const;

    CallLog& log_;
    Untold untold_;
    std::map<std::string, std::any> replies_;
    std::map<std::string, std::exception_ptr> failures_;
};

} // namespace foundation::tests::support
