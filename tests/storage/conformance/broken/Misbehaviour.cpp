#include <tests/storage/conformance/broken/Misbehaviour.hpp>

#include <tests/support/VectorListing.hpp>

#include <algorithm>
#include <thread>
#include <utility>

namespace foundation::storage::conformance::broken {

namespace {

class MisbehavingStream final : public ByteStream
{
public:
    MisbehavingStream(Bytes sound, Misbehaviour const& misbehaviour)
        : sound_(std::move(sound)), misbehaviour_(misbehaviour)
    {}

protected:
    long doRead(char* buffer, long count) override
    {
        return misbehaviour_.read ? misbehaviour_.read(*sound_, buffer, count) : sound_->read(buffer, count);
    }

    long doWrite(char const* data, long count) override
    {
        return misbehaviour_.write ? misbehaviour_.write(*sound_, data, count) : sound_->write(data, count);
    }

    long doSeek(long offset, std::ios_base::seekdir direction) override
    {
        return misbehaviour_.seek ? misbehaviour_.seek(*sound_, offset, direction) : sound_->seek(offset, direction);
    }

    void doClose() override
    {
        ++closed_;
        misbehaviour_.close ? misbehaviour_.close(*sound_, closed_) : sound_->close();
    }

private:
    Bytes sound_;
    Misbehaviour misbehaviour_;
    int closed_ = 0;
};

class MisbehavingProvider final : public ForwardingProvider
{
public:
    MisbehavingProvider(std::shared_ptr<IProvider> sound, Misbehaviour const& misbehaviour)
        : ForwardingProvider(std::move(sound)), m(misbehaviour)
    {}

protected:
    StorageIRI translated(Iri iri) const override { return m.translated ? m.translated(iri) : iri; }

    void doCreateFile(Iri iri) const override
    {
        m.createFile ? m.createFile(target(), iri) : ForwardingProvider::doCreateFile(iri);
    }

    void doCreateFolder(Iri iri) const override
    {
        m.createFolder ? m.createFolder(target(), iri) : ForwardingProvider::doCreateFolder(iri);
    }

    void doCreateFolderRecursive(Iri iri) const override
    {
        m.createFolderRecursive ? m.createFolderRecursive(target(), iri)
                                : ForwardingProvider::doCreateFolderRecursive(iri);
    }

    bool doFileExists(Iri iri) const override
    {
        return m.fileExists ? m.fileExists(target(), iri) : ForwardingProvider::doFileExists(iri);
    }

    bool doFolderExists(Iri iri) const override
    {
        return m.folderExists ? m.folderExists(target(), iri) : ForwardingProvider::doFolderExists(iri);
    }

    ExistenceType doExists(Iri iri) const override
    {
        return m.exists ? m.exists(target(), iri) : ForwardingProvider::doExists(iri);
    }

    ExistenceTypeExtended doExistsExtended(Iri iri) const override
    {
        return m.existsExtended ? m.existsExtended(target(), iri) : ForwardingProvider::doExistsExtended(iri);
    }

    void doRemoveFile(Iri iri) const override
    {
        m.removeFile ? m.removeFile(target(), iri) : ForwardingProvider::doRemoveFile(iri);
    }

    void doRemoveFolder(Iri iri) const override
    {
        m.removeFolder ? m.removeFolder(target(), iri) : ForwardingProvider::doRemoveFolder(iri);
    }

    void doRemoveFolderRecursively(Iri iri) const override
    {
        m.removeFolderRecursively ? m.removeFolderRecursively(target(), iri)
                                  : ForwardingProvider::doRemoveFolderRecursively(iri);
    }

    void doMoveFile(Iri from, Iri to, Policy const& policy) const override
    {
        m.moveFile ? m.moveFile(target(), from, to, policy) : ForwardingProvider::doMoveFile(from, to, policy);
    }

    void doMoveFolder(Iri from, Iri to, Policy const& policy) const override
    {
        m.moveFolder ? m.moveFolder(target(), from, to, policy) : ForwardingProvider::doMoveFolder(from, to, policy);
    }

    void doCopyFile(Iri from, Iri to, Policy const& policy) const override
    {
        m.copyFile ? m.copyFile(target(), from, to, policy) : ForwardingProvider::doCopyFile(from, to, policy);
    }

    TransactionStatus doCopyFileAtomic(Iri from, Iri to, Policy const& policy,
                                       Interrupt const& interrupt) const override
    {
        return m.copyFileAtomic ? m.copyFileAtomic(target(), from, to, policy, interrupt)
                                : ForwardingProvider::doCopyFileAtomic(from, to, policy, interrupt);
    }

    FileAttributes doGetFileAttributes(Iri iri) const override
    {
        return m.getFileAttributes ? m.getFileAttributes(target(), iri) : ForwardingProvider::doGetFileAttributes(iri);
    }

    FolderAttributes doGetFolderAttributes(Iri iri) const override
    {
        return m.getFolderAttributes ? m.getFolderAttributes(target(), iri)
                                     : ForwardingProvider::doGetFolderAttributes(iri);
    }

    void doSetLastModified(Iri iri, boost::posix_time::ptime const& time) const override
    {
        m.setLastModified ? m.setLastModified(target(), iri, time) : ForwardingProvider::doSetLastModified(iri, time);
    }

    void doSetWritable(Iri iri, bool writable) const override
    {
        m.setWritable ? m.setWritable(target(), iri, writable) : ForwardingProvider::doSetWritable(iri, writable);
    }

    Bytes doOpenStream(Iri iri, ByteStreamOpenOptions const& options) const override
    {
        return m.openStream ? m.openStream(target(), iri, options) : ForwardingProvider::doOpenStream(iri, options);
    }

    Bytes doOpenReadOnlyStream(Iri iri) const override
    {
        return m.openReadOnlyStream ? m.openReadOnlyStream(target(), iri)
                                    : ForwardingProvider::doOpenReadOnlyStream(iri);
    }

    Bytes handOutStream(Bytes stream, Iri) const override
    {
        return std::make_unique<MisbehavingStream>(std::move(stream), m);
    }

    Transaction doOpenTransactionalStream(Iri iri, ByteStreamOpenOptions const& options) const override
    {
        return m.openTransactionalStream ? m.openTransactionalStream(target(), iri, options)
                                         : ForwardingProvider::doOpenTransactionalStream(iri, options);
    }

    Listing list(char const* name, ListingOperation operation, Iri folder, std::u16string pattern) const override
    {
        return m.list ? m.list({target(), name, operation, folder, pattern})
                      : ForwardingProvider::list(name, operation, folder, pattern);
    }

    void doPublishFolderEventsFor(Iri iri, ChangeEventCallback const& callback, Kinds kinds) const override
    {
        m.publishFolderEventsFor ? m.publishFolderEventsFor(target(), iri, callback, kinds)
                                 : ForwardingProvider::doPublishFolderEventsFor(iri, callback, kinds);
    }

    void doPublishFileEventsFor(Iri iri, ChangeEventCallback const& callback, Kinds kinds) const override
    {
        m.publishFileEventsFor ? m.publishFileEventsFor(target(), iri, callback, kinds)
                               : ForwardingProvider::doPublishFileEventsFor(iri, callback, kinds);
    }

    void doStopPublishingEventsFor(Iri iri) const override
    {
        m.stopPublishingEventsFor ? m.stopPublishingEventsFor(target(), iri)
                                  : ForwardingProvider::doStopPublishingEventsFor(iri);
    }

    bool doHasFeature(ExtendedFeature const& feature) const override
    {
        return m.hasFeature ? m.hasFeature(target(), feature) : ForwardingProvider::doHasFeature(feature);
    }

    PathComparator doGetPathComparator(Iri iri) const override
    {
        return m.getPathComparator ? m.getPathComparator(target(), iri) : ForwardingProvider::doGetPathComparator(iri);
    }

    StorageIRI doGetCanonicalLocation(Iri iri) const override
    {
        return m.getCanonicalLocation ? m.getCanonicalLocation(target(), iri)
                                      : ForwardingProvider::doGetCanonicalLocation(iri);
    }

    FilenameSensitivity doGetFilenameSensitivity(Iri iri) const override
    {
        return m.getFilenameSensitivity ? m.getFilenameSensitivity(target(), iri)
                                        : ForwardingProvider::doGetFilenameSensitivity(iri);
    }

private:
    Misbehaviour const m;
};

/// Serves the thread that made it alone.
class OfOneThread final : public ForwardingProvider
{
public:
    using ForwardingProvider::ForwardingProvider;

protected:
    void before(char const*, Iri location) const override
    {
        if (std::this_thread::get_id() != owner_)
            throw Exception(ErrorCode::InternalError, location);
    }

private:
    std::thread::id const owner_ = std::this_thread::get_id();
};

} // namespace

std::shared_ptr<IProvider> servingOneThread(std::shared_ptr<IProvider> sound)
{
    return std::make_shared<OfOneThread>(std::move(sound));
}

std::shared_ptr<IProvider> misbehaving(std::shared_ptr<IProvider> sound, Misbehaviour const& misbehaviour)
{
    return std::make_shared<MisbehavingProvider>(std::move(sound), misbehaviour);
}

StorageIRI inSmallLetters(Iri iri)
{
    if (!iri.hasParent())
        return iri;
    std::u16string name = iri.getName();
    for (char16_t& unit : name)
        unit = unit >= u'A' && unit <= u'Z' ? static_cast<char16_t>(unit - u'A' + u'a') : unit;
    return sibling(iri, name);
}

StorageIRI composed(Iri iri)
{
    if (!iri.hasParent())
        return iri;
    std::u16string name = iri.getName();
    for (std::size_t at; (at = name.find(u"e\u0301")) != name.npos;)
        name.replace(at, 2, u"\u00E9");
    return sibling(iri, name);
}

StorageIRI cutShort(Iri iri)
{
    return iri.hasParent() ? sibling(iri, iri.getName().substr(0, 100)) : iri;
}

StorageIRI sibling(Iri iri, std::u16string const& name)
{
    return StorageIRI(iri.getParent(), name);
}

bool preserves(Policy policy)
{
    return policy == Policy::Preserve || policy == Policy::NoClobber;
}

long withoutTheLastByte(ByteStream& stream, char const* data, long count)
{
    return count == 0 ? stream.write(data, 0) : stream.write(data, count - 1) + 1;
}

std::vector<FolderEntry> entriesOf(Listing const& listing)
{
    std::vector<FolderEntry> found;
    for (FolderEntry const& entry : entries(*listing))
        found.push_back(entry);
    return found;
}

Listing filtered(Listing const& listing, bool (*wanted)(FolderEntry const& entry))
{
    std::vector<FolderEntry> found = entriesOf(listing);
    std::erase_if(found, [&](FolderEntry const& entry) { return !wanted(entry); });
    return std::make_unique<tests::support::VectorListing>(std::move(found));
}

void copyInPlace(Store store, Iri from, Iri to, long most)
{
    Bytes const source = store.openReadOnlyStream(from);
    Bytes const target = store.openStream(to, {});
    std::vector<char> buffer(static_cast<std::size_t>(most));
    for (long left = most; left > 0;) {
        long const count = source->read(buffer.data(), left);
        if (count < 1)
            break;
        target->write(buffer.data(), count);
        left -= count;
    }
    target->close();
}

} // namespace foundation::storage::conformance::broken
