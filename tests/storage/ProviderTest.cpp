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
               ChangeEventsNotSupportedException, ChangeEventsSubscriptionException, ContainerProviderFactory,
               CopyFileOptions, ErrorCode, ErrorCodeInfo, Exception, ExistenceType, ExistenceTypeExtended,
               ExtendedAttributes, ExtendedFeature, FileAttributes, FilenameSensitivity, FolderAttributes, FolderEntry,
               GenericByteStreamDevice<ByteStream>, IConfigurableProvider, IFolderEntryIterator, IProvider,
               IReadOnlyProvider, InterruptSignal, PathComparator, PathView, PathViewIterator, PhysicalProviderFactory,
               ReplacementPolicy, StorageIRI, StorageIRIInfo, StorageItem, StreamClosePolicy, TagErrorCode,
               TagStorageIRI, TransactionPolicy, TransactionStatus, TransactionalStream, TransactionalStreamDevice>()),
        47u);
}

} // namespace
} // namespace foundation::storage::provider
