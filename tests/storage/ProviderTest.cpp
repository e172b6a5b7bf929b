#include <storage/provider.hpp>

#include <gtest/gtest.h>

#include <cstddef>

namespace foundation::storage::provider {
namespace {

// One header offers the whole core: each of these must be a complete type here.
template <class... Types>
constexpr std::size_t count()
{
    return ((sizeof(Types) > 0 ? 1u : 0u) + ...);
}

TEST(Provider, OneHeaderOffersTheWholeCore)
{
    EXPECT_EQ(
        (count<ByteStream, ByteStreamAccess, ByteStreamAppend, ByteStreamCreate, ByteStreamDevice, ByteStreamFailure,
               ByteStreamOpenOptions, ByteStreamTruncate, ByteStreamWriteFailure, CaseModifier, ChangeEventCallback,
               ChangeEventsNotSupportedException, ChangeEventsSubscriptionException, CopyFileOptions, ErrorCode,
               ErrorCodeInfo, Exception, ExistenceType, ExistenceTypeExtended, ExtendedAttributes, ExtendedFeature,
               FileAttributes, FilenameSensitivity, FolderAttributes, FolderEntry, GenericByteStreamDevice<ByteStream>,
               IFolderEntryIterator, IProvider, InterruptSignal, PathComparator, PathView, PathViewIterator,
               ReplacementPolicy, StorageIRI, StorageIRIInfo, StorageItem, StreamClosePolicy, TagErrorCode,
               TagStorageIRI, TransactionPolicy, TransactionStatus, TransactionalStream, TransactionalStreamDevice>()),
        43u);
}

} // namespace
} // namespace foundation::storage::provider
