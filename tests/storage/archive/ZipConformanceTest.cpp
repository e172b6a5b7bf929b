#include <storage/archive/ArchiveProvider.hpp>

#include <storage/conformance/ForwardingProvider.hpp>
#include <storage/conformance/registerConformance.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/zips.hpp>

#include <memory>

namespace foundation::storage::conformance {

namespace {

using archive::ArchiveProvider;

/// Has every operation find an archive that was just written, with nothing pending.
class FlushingProvider : public ForwardingProvider
{
public:
    explicit FlushingProvider(std::shared_ptr<ArchiveProvider> archive)
        : ForwardingProvider(archive), archive_(std::move(archive))
    {}

protected:
    void before(char const* /*operation*/, provider::StorageIRI const& /*location*/) const override
    {
        archive_->flush();
    }

private:
    std::shared_ptr<ArchiveProvider> archive_;
};

std::shared_ptr<ArchiveProvider> openZip(provider::StorageItem const& container)
{
    return std::make_shared<ArchiveProvider>(archive::ArchiveFormat::Zip, container);
}

Place makePlace()
{
    provider::StorageItem const container = archive::makeFile(archive::makeZip({}));
    return {.provider = openZip(container), .folder = provider::StorageIRI(u"zip", container.getLocation(), u"/")};
}

Place makeFlushedPlace()
{
    provider::StorageItem const container = archive::makeFile(archive::makeZip({}));
    return {.provider = std::make_shared<FlushingProvider>(openZip(container)),
            .folder = provider::StorageIRI(u"zip", container.getLocation(), u"/")};
}

/// In a zip that lies in a zip.
Place makeNestedPlace()
{
    provider::StorageItem const outer =
        archive::makeFile(archive::makeZip({{.name = "in.zip", .content = archive::makeZip({})}}));
    provider::StorageItem const inner(archive::openRoot(archive::ArchiveFormat::Zip, outer), u"in.zip");
    return {.provider = openZip(inner), .folder = provider::StorageIRI(u"zip", inner.getLocation(), u"/")};
}

Harness harness(std::function<Place()> const& makePlace)
{
    return {.makePlace = makePlace,
            .capabilities = {.recursiveRemoval = true,
                             .recursiveListing = true,
                             .atomicCopy = true,
                             .copyOntoItself = CopyOntoItself::ChangesNothing,
                             .patterns = Patterns::Globs,
                             .settableTimes = boost::posix_time::seconds(1),
                             .extendedAttributes = {"archive.access"}}};
}

} // namespace

FOUNDATION_STORAGE_CONFORMANCE(Zip, harness(makePlace));
FOUNDATION_STORAGE_CONFORMANCE(FlushedZip, harness(makeFlushedPlace));
FOUNDATION_STORAGE_CONFORMANCE(NestedZip, harness(makeNestedPlace));

} // namespace foundation::storage::conformance
