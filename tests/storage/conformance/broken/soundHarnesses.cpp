#include <tests/storage/conformance/broken/soundHarnesses.hpp>

#include <storage/conformance/detail/content.hpp>
#include <storage/provider/IReadOnlyProvider.hpp>
#include <storage/provider/StorageItem.hpp>
#include <storage/provider/TransactionPolicy.hpp>
#include <tests/storage/conformance/broken/Misbehaviour.hpp>
#include <tests/support/VectorListing.hpp>

#include <utility>

namespace foundation::storage::conformance::broken {

namespace {

class PlainProvider final : public IProvider
{
public:
    explicit PlainProvider(std::shared_ptr<IProvider> store) : store_(std::move(store)) {}

protected:
    void doCreateFile(Iri iri) const override { store_->createFile(iri); }
    void doCreateFolder(Iri iri) const override { store_->createFolder(iri); }
    bool doFileExists(Iri iri) const override { return store_->fileExists(iri); }
    bool doFolderExists(Iri iri) const override { return store_->folderExists(iri); }
    void doRemoveFile(Iri iri) const override { store_->removeFile(iri); }
    void doMoveFile(Iri from, Iri to, Policy const& policy) const override { store_->moveFile(from, to, policy); }
    void doRemoveFolder(Iri iri) const override { store_->removeFolder(iri); }
    void doMoveFolder(Iri from, Iri to, Policy const& policy) const override { store_->moveFolder(from, to, policy); }
    FileAttributes doGetFileAttributes(Iri iri) const override { return store_->getFileAttributes(iri); }
    FolderAttributes doGetFolderAttributes(Iri iri) const override { return store_->getFolderAttributes(iri); }
    Bytes doOpenStream(Iri iri, ByteStreamOpenOptions const& options) const override
    {
        return store_->openStream(iri, options);
    }
    Bytes doOpenReadOnlyStream(Iri iri) const override { return store_->openReadOnlyStream(iri); }
    Listing doListAll(Iri folder) const override { return store_->listAll(folder); }
    Listing doListFiles(Iri folder) const override { return store_->listFiles(folder); }
    Listing doListFolders(Iri folder) const override { return store_->listFolders(folder); }

private:
    std::shared_ptr<IProvider> store_;
};

FileAttributes unwritable(FileAttributes const& attributes)
{
    return FileAttributes(attributes.getSize(), attributes.getLastModified(), false);
}

FolderAttributes unwritable(FolderAttributes const& attributes)
{
    return FolderAttributes(attributes.getLastModified(), false);
}

Listing unwritable(Listing const& listing)
{
    std::vector<FolderEntry> found;
    for (FolderEntry const& entry : entries(*listing)) {
        if (entry.isFile())
            found.emplace_back(entry.getName(), unwritable(*entry.getFileAttributes()));
        else
            found.emplace_back(entry.getName(), unwritable(*entry.getFolderAttributes()));
    }
    return std::make_unique<tests::support::VectorListing>(std::move(found));
}

class ReadOnlyProvider final : public IReadOnlyProvider
{
public:
    explicit ReadOnlyProvider(std::shared_ptr<IProvider> store) : store_(std::move(store)) {}

protected:
    bool doFileExists(Iri iri) const override { return store_->fileExists(iri); }
    bool doFolderExists(Iri iri) const override { return store_->folderExists(iri); }
    FileAttributes doGetFileAttributes(Iri iri) const override { return unwritable(store_->getFileAttributes(iri)); }
    FolderAttributes doGetFolderAttributes(Iri iri) const override
    {
        return unwritable(store_->getFolderAttributes(iri));
    }
    Bytes doOpenReadOnlyStream(Iri iri) const override { return store_->openReadOnlyStream(iri); }
    Listing doListAll(Iri folder) const override { return unwritable(store_->listAll(folder)); }
    Listing doListFiles(Iri folder) const override { return unwritable(store_->listFiles(folder)); }
    Listing doListFolders(Iri folder) const override { return unwritable(store_->listFolders(folder)); }

private:
    std::shared_ptr<IProvider> store_;
};

class RecursiveProvider final : public ForwardingProvider
{
public:
    using ForwardingProvider::ForwardingProvider;

protected:
    void doRemoveFolderRecursively(Iri iri) const override
    {
        if (!isRealFolder(iri))
            throw Exception(ErrorCode::ResourceNotFound, iri);
        for (FolderEntry const& entry : entriesOf(target().listAll(iri))) {
            StorageIRI const inner(iri, entry.getName());
            isRealFolder(inner) ? doRemoveFolderRecursively(inner) : target().removeFile(inner);
        }
        target().removeFolder(iri);
    }

    bool doHasFeature(ExtendedFeature const& feature) const override
    {
        return feature == ExtendedFeature::RecursiveFolderRemoval || target().hasFeature(feature);
    }

    Listing list(char const* name, ListingOperation operation, Iri folder, std::u16string) const override
    {
        return ForwardingProvider::list(name, operation, folder, {});
    }

    Listing doListAllRecursive(Iri folder) const override
    {
        std::vector<FolderEntry> found;
        addTo(found, folder, {});
        return std::make_unique<tests::support::VectorListing>(std::move(found));
    }
    Listing doListAllRecursiveWildcards(Iri folder, std::u16string) const override
    {
        return doListAllRecursive(folder);
    }
    Listing doListAllRecursiveNamesOnly(Iri folder) const override { return doListAllRecursive(folder); }
    Listing doListAllRecursiveNamesOnlyWildcards(Iri folder, std::u16string) const override
    {
        return doListAllRecursive(folder);
    }

private:
    bool isRealFolder(Iri iri) const { return target().existsExtended(iri) == ExistenceTypeExtended::RegularFolder; }

    void addTo(std::vector<FolderEntry>& found, Iri folder, std::u16string const& prefix) const
    {
        for (FolderEntry const& entry : entriesOf(target().listAll(folder))) {
            std::u16string const path = prefix + entry.getName();
            if (entry.isFile())
                found.emplace_back(path, *entry.getFileAttributes());
            else
                found.emplace_back(path, *entry.getFolderAttributes());
            StorageIRI const inner(folder, entry.getName());
            if (isRealFolder(inner))
                addTo(found, inner, path + u'/');
        }
    }
};

class AtomicProvider final : public ForwardingProvider
{
public:
    explicit AtomicProvider(std::shared_ptr<IProvider> store) : ForwardingProvider(store), store_(std::move(store)) {}

protected:
    TransactionStatus doCopyFileAtomic(Iri from, Iri to, Policy const& policy,
                                       Interrupt const& interrupt) const override
    {
        return StorageItem(store_, from)
            .copyFile(StorageItem(store_, to), {policy, TransactionPolicy::Atomic, interrupt});
    }

    bool doHasFeature(ExtendedFeature const& feature) const override
    {
        return feature == ExtendedFeature::AtomicFileCopy || target().hasFeature(feature);
    }

private:
    std::shared_ptr<IProvider> store_;
};

/// The harness with every provider wrapped.
template <typename Wrap>
Harness wrapped(Harness harness, Wrap const& wrap)
{
    harness.makePlace = [make = harness.makePlace, wrap] {
        Place place = make();
        place.provider = wrap(place.provider);
        return place;
    };
    return harness;
}

Harness translatedHarness(StorageIRI (*translated)(Iri))
{
    return wrapped(memoryHarness(), [=](std::shared_ptr<IProvider> const& store) {
        return misbehaving(store, {.translated = translated});
    });
}

} // namespace

Harness plainHarness()
{
    Harness harness = wrapped(localHarness(), [](auto const& store) { return std::make_shared<PlainProvider>(store); });
    harness.capabilities = {.longestName = 255};
    harness.makers = {};
    return harness;
}

Harness readOnlyHarness()
{
    return {.capabilities = {.writable = false}, .makeFilledPlace = [](Tree const& content) {
                Place place = memoryHarness().makePlace();
                detail::makeTree(StorageItem(place.provider, place.folder), content);
                place.provider = std::make_shared<ReadOnlyProvider>(place.provider);
                return place;
            }};
}

Harness recursiveHarness()
{
    Harness harness =
        wrapped(localHarness(), [](auto const& store) { return std::make_shared<RecursiveProvider>(store); });
    harness.capabilities.patterns = Patterns::Ignored;
    harness.capabilities.recursiveListing = true;
    harness.capabilities.recursiveRemoval = true;
    return harness;
}

Harness atomicHarness()
{
    Harness harness =
        wrapped(localHarness(), [](auto const& store) { return std::make_shared<AtomicProvider>(store); });
    harness.capabilities.atomicCopy = true;
    return harness;
}

Harness caselessHarness()
{
    Harness harness = translatedHarness(inSmallLetters);
    harness.capabilities.caseSensitive = false;
    harness.capabilities.casePreserving = false;
    return harness;
}

Harness unnormalisedHarness()
{
    Harness harness = translatedHarness(composed);
    harness.capabilities.normalisationSensitive = false;
    return harness;
}

Harness dotlessHarness()
{
    Harness harness = wrapped(memoryHarness(), [](std::shared_ptr<IProvider> const& store) {
        return misbehaving(store, {.exists = [](Store sound, Iri iri) {
                               bool const dots = iri.getPath().find(u"/.") != std::u16string::npos;
                               return dots ? ExistenceType::AsNeither : sound.exists(iri);
                           }});
    });
    harness.capabilities.resolvesDots = false;
    return harness;
}

Harness pickyHarness()
{
    Harness harness = translatedHarness([](Iri iri) {
        if (iri.hasParent() && iri.getName() == u"con")
            throw Exception(ErrorCode::InvalidLocation, iri);
        return iri;
    });
    harness.capabilities.refusedNames = {u"con"};
    return harness;
}

} // namespace foundation::storage::conformance::broken
