#pragma once

// Every public header of the core.

#include <storage/provider/ByteStream.hpp>
#include <storage/provider/ByteStreamDevice.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/ByteStreamOpenOptions.hpp>
#include <storage/provider/CaseModifier.hpp>
#include <storage/provider/ChangeEventExceptions.hpp>
#include <storage/provider/ContainerProviderFactory.hpp>
#include <storage/provider/Conversions.hpp>
#include <storage/provider/CopyFileOptions.hpp>
#include <storage/provider/ErrorCode.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/ExistenceType.hpp>
#include <storage/provider/ExtendedAttributes.hpp>
#include <storage/provider/ExtendedFeature.hpp>
#include <storage/provider/FileAttributes.hpp>
#include <storage/provider/FolderAttributes.hpp>
#include <storage/provider/FolderEntry.hpp>
#include <storage/provider/IConfigurableProvider.hpp>
#include <storage/provider/IFolderEntryIterator.hpp>
#include <storage/provider/IProvider.hpp>
#include <storage/provider/IReadOnlyProvider.hpp>
#include <storage/provider/InterruptSignal.hpp>
#include <storage/provider/PathView.hpp>
#include <storage/provider/PhysicalProviderFactory.hpp>
#include <storage/provider/ReasonInfo.hpp>
#include <storage/provider/ReplacementPolicy.hpp>
#include <storage/provider/StorageIRI.hpp>
#include <storage/provider/StorageItem.hpp>
#include <storage/provider/StreamClosePolicy.hpp>
#include <storage/provider/TransactionPolicy.hpp>
#include <storage/provider/TransactionStatus.hpp>
#include <storage/provider/TransactionalStream.hpp>
