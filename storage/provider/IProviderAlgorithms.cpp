// The algorithms that a provider inherits, composed of its own operations.

#include <storage/provider/IProvider.hpp>

#include <fl/i18n/convert.hpp>
#include <storage/provider/ByteStreamDevice.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/detail/GenericTransactionalStream.hpp>

#include <boost/iostreams/copy.hpp>
#include <boost/uuid/random_generator.hpp>
#include <boost/uuid/uuid_io.hpp>

#include <deque>
#include <stdexcept>
#include <utility>

namespace foundation::storage::provider {

namespace {

StorageIRI requireParent(StorageIRI const& iri)
{
    try {
        return iri.getParent();
    } catch (std::logic_error const&) {
        throw Exception(ErrorCode::InvalidLocation, iri);
    }
}

/// A name that no other writer picks: a random UUID and ".tmp.bak".
std::u16string scratchName()
{
    return fl::i18n::to_ustring(boost::uuids::to_string(boost::uuids::random_generator()())) + u".tmp.bak";
}

class BrokenStreamFailure final : public ByteStreamFailure
{
public:
    BrokenStreamFailure()
        : ByteStreamFailure("Stream answered an impossible count.", std::make_error_code(std::io_errc::stream),
                            ErrorCode::IOError)
    {}

    core::except::IException* clone() const override { return new BrokenStreamFailure(*this); }
    [[noreturn]] void rethrow() const override { throw BrokenStreamFailure(*this); }
};

/// Fails where a broken stream answers 0, on which the copy loop would spin for ever, or a count that would lead it out
/// of its buffer.
class CheckedDevice : public ByteStreamDevice
{
public:
    using ByteStreamDevice::ByteStreamDevice;

    long read(char* buffer, long count) const { return check(ByteStreamDevice::read(buffer, count), count); }
    long write(char const* data, long count) const { return check(ByteStreamDevice::write(data, count), count); }

private:
    static long check(long moved, long count)
    {
        bool const stalled = moved == 0 && count != 0;
        if (stalled || moved < -1 || moved > count)
            throw BrokenStreamFailure();
        return moved;
    }
};

constexpr ByteStreamOpenOptions copyTargetOptions{ByteStreamAccess::ReadWrite, ByteStreamCreate::Create,
                                                  ByteStreamTruncate::TruncateExisting, ByteStreamAppend::Overwrite};
constexpr long copyBufferSize = 4096;

} // namespace

void IProvider::doCreateFolderRecursive(StorageIRI const& iri) const
{
    if (!iri.hasParent())
        throw Exception(doFolderExists(iri) ? ErrorCode::ResourceAlreadyExists : ErrorCode::ResourceNotFound, iri);
    if (doFolderExists(requireParent(iri))) {
        doCreateFolder(iri);
        return;
    }
    for (StorageIRI const& folder : missingFolders(iri)) {
        try {
            doCreateFolder(folder);
        } catch (Exception const& error) {
            throw Exception(error.getErrorCode(), iri);
        }
    }
}

std::deque<StorageIRI> IProvider::missingFolders(StorageIRI const& iri) const
{
    try {
        std::deque<StorageIRI> pending{iri};
        for (StorageIRI parent = iri.getParent(); !doFolderExists(parent); parent = parent.getParent())
            pending.push_front(parent);
        return pending;
    } catch (std::logic_error const&) {
        throw Exception(ErrorCode::InvalidLocation, iri);
    }
}

std::unique_ptr<TransactionalStream> IProvider::doOpenTransactionalStream(StorageIRI const& iri,
                                                                          ByteStreamOpenOptions const& options) const
{
    StorageIRI const folder = iri.getParent();
    return doOpenTransactionalStreamAtScratchLocation(iri, StorageIRI(folder, scratchName()), options);
}

std::unique_ptr<TransactionalStream>
IProvider::doOpenTransactionalStreamAtScratchLocation(StorageIRI const& target, StorageIRI const& scratch,
                                                      ByteStreamOpenOptions const& options) const
{
    auto const finish = [this, target, scratch](StreamClosePolicy const& policy) {
        if (policy == StreamClosePolicy::Commit)
            moveFile(scratch, target, ReplacementPolicy::Overwrite);
        else
            removeFile(scratch);
    };
    return std::make_unique<detail::GenericTransactionalStream<ByteStream>>(openStream(scratch, options), finish);
}

void IProvider::doCopyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    bool const fileExists = doFileExists(to);
    bool const preserves = policy == ReplacementPolicy::Preserve || policy == ReplacementPolicy::NoClobber;
    if ((fileExists && preserves) || doFolderExists(to))
        throw Exception(ErrorCode::ResourceAlreadyExists, to);
    std::unique_ptr<ByteStream> source = doOpenReadOnlyStream(from);
    std::unique_ptr<ByteStream> target = doOpenStream(to, copyTargetOptions);
    try {
        boost::iostreams::copy(CheckedDevice(source), CheckedDevice(target), copyBufferSize);
    } catch (ByteStreamFailure const& failure) {
        throw Exception(failure.getErrorCode(), from);
    }
}

} // namespace foundation::storage::provider
