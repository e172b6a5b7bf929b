#include <tools/storage/FileCopier.hpp>

#include <tools/storage/AtomicFile.hpp>
#include <tools/storage/PlainFile.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/explain.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/physicalPath.hpp>
#include <tools/storage/readSome.hpp>

#include <algorithm>
#include <cstring>
#include <memory>
#include <optional>
#include <storage/provider/Exception.hpp>
#include <storage/provider/ExtendedFeature.hpp>
#include <utility>

namespace foundation::storage::tool {

using boost::posix_time::ptime;

namespace {

/// Less is not worth a hole.
constexpr std::size_t minimumHole = 4096;

bool isAllZero(std::string_view chunk)
{
    return chunk.size() >= minimumHole && chunk.front() == '\0' &&
           std::memcmp(chunk.data(), chunk.data() + 1, chunk.size() - 1) == 0;
}

void checkStop(WorkerContext const& context)
{
    checkInterrupt();
    if (context.stop.stop_requested())
        throw Interrupted{0};
}

std::unique_ptr<TargetFile> openTarget(Place const& target, CopyOptions const& options)
{
    return at(target, [&]() -> std::unique_ptr<TargetFile> {
        if (options.isInPlace)
            return std::make_unique<PlainFile>(target.item(), options.replace);
        return std::make_unique<AtomicFile>(target.item(), options.replace);
    });
}

/// Progress in a file that the store copies. Stores do not tell how much they copy between two questions: it is taken
/// for a MiB, as local files do, until the end is known.
class FileProgress
{
public:
    FileProgress(Progress& progress, long size) : progress_(progress), rest_(size) {}

    void addChunk()
    {
        if (std::exchange(hasBegun_, true))
            add(std::min(rest_, chunk));
    }
    void addRest() { add(rest_); }

private:
    static constexpr long chunk = 1L << 20U;

    void add(long count)
    {
        progress_.addBytes(count);
        rest_ -= count;
    }

    Progress& progress_;
    long rest_;
    bool hasBegun_ = false;
};

/// To be called from a handler: throws what is being handled, together with what is left of the target.
[[noreturn]] void rethrowWithLeftover(Place const& target, TargetFile const& output)
{
    try {
        throw;
    } catch (Failure const& failure) {
        std::string const where = failure.location == target.text() ? "" : target.text() + ": ";
        throw Failure{failure.location, failure.reason + "; " + where + output.leftover()};
    } catch (...) {
        throw Failure{target.text(), output.leftover()};
    }
}

/// A copy is younger than what it was made of.
std::optional<std::uint64_t> sizeIfUpToDate(Place const& source, Place const& target)
{
    auto const original = at(source, [&] { return source.item().getFileAttributes(); });
    auto const copied = at(target, [&] { return target.item().getFileAttributes(); });
    bool const isUpToDate =
        original.getSize() == copied.getSize() && copied.getLastModified() >= original.getLastModified();
    return isUpToDate ? std::optional(original.getSize()) : std::nullopt;
}

/// Local files that are copied by their store have it already, to the nanosecond.
std::optional<ptime> timeToKeep(Place const& source, bool isCopiedInStore, CopyOptions const& options)
{
    if (!options.keepsMetadata || (isCopiedInStore && isLocal(source)))
        return std::nullopt;
    return at(source, [&] { return source.item().getFileAttributes().getLastModified(); });
}

} // namespace

void keepTime(std::optional<ptime> const& time, Place const& copy)
{
    if (!time || time->is_special())
        return;
    try {
        copy.item().setLastModified(*time);
    } catch (provider::Exception const& error) {
        if (error.getErrorCode() != provider::ErrorCode::UnsupportedOperation)
            throw Failure{copy.text(), "in place, without the time of its source: " + explain(error)};
    }
}

void requireFileTarget(Place const& target, Kind kind, Replace replace)
{
    switch (kind) {
    case Kind::None:
        return;
    case Kind::RegularFolder:
    case Kind::SymlinkToFolder:
        throw Failure{target.text(), "a folder, which a file never replaces"};
    case Kind::SpecialFile:
        throw Failure{target.text(), "a special file, which a file never replaces"};
    case Kind::RegularFile:
    case Kind::SymlinkToFile:
    case Kind::BrokenSymlink:
        if (replace == Replace::Never)
            throw Failure{target.text(), "exists already (--replace replaces it)"};
    }
}

void requireFileTarget(Place const& target, Replace replace)
{
    requireFileTarget(target, kindOf(target), replace);
}

FileCopier::FileCopier(Progress& progress, CopyOptions const& options) : progress_(progress), options_(options) {}

CopiedFile FileCopier::copy(Place const& source, Place const& target, TargetState state, WorkerContext& context) const
{
    checkStop(context);
    Kind const kind = state == TargetState::Free ? Kind::None : kindOf(target);
    if (options_.isUpdate && kind == Kind::RegularFile) {
        if (auto const size = sizeIfUpToDate(source, target)) {
            progress_.skipFile(*size);
            return {*size, true};
        }
    }
    requireFileTarget(target, kind, options_.replace);
    if (options_.isInPlace && isLink(kind))
        throw Failure{target.text(), "a link, through which nothing is written"};
    bool const copiesItself = !options_.isInPlace && source.item().hasSameProviderInstance(target.item()) &&
                              source.item().hasFeature(provider::ExtendedFeature::AtomicFileCopy);
    std::optional<ptime> const time = timeToKeep(source, copiesItself, options_);
    std::uint64_t const size = copiesItself ? copyInStore(source, target, context) : transfer(source, target, context);
    keepTime(time, target);
    progress_.addFile();
    return {size, false};
}

std::uint64_t FileCopier::copyInStore(Place const& source, Place const& target, WorkerContext& context) const
{
    auto const size = static_cast<long>(at(source, [&] { return source.item().getFileAttributes().getSize(); }));
    FileProgress told(progress_, size);
    auto const onChunk = [&] {
        checkStop(context);
        told.addChunk();
        return provider::InterruptSignal::Continue;
    };
    auto const policy = options_.replace == Replace::Files ? provider::ReplacementPolicy::Overwrite
                                                           : provider::ReplacementPolicy::NoClobber;
    try {
        source.item().copyFileAtomic(target.item().getLocation(), policy, onChunk);
    } catch (provider::Exception const& error) {
        rethrowAsFailure(error.getStorageIRI() == target.item().getLocation() ? target : source);
    } catch (std::exception const&) {
        rethrowAsFailure(source);
    }
    told.addRest();
    return static_cast<std::uint64_t>(size);
}

std::uint64_t FileCopier::transfer(Place const& source, Place const& target, WorkerContext& context) const
{
    auto const input = at(source, [&] { return source.item().openReadOnlyStream(); });
    auto const output = openTarget(target, options_);
    try {
        std::uint64_t const size = copyBytes(source, *input, target, *output, context);
        at(target, [&] { output->commit(static_cast<long>(size)); });
        return size;
    } catch (...) {
        if (!output->discard())
            rethrowWithLeftover(target, *output);
        throw;
    }
}

std::uint64_t FileCopier::copyBytes(Place const& source, provider::ByteStream& input, Place const& target,
                                    TargetFile& output, WorkerContext& context) const
{
    std::uint64_t size = 0;
    for (std::string_view chunk = readSome(source, input, context.buffer); !chunk.empty();
         chunk = readSome(source, input, context.buffer))
    {
        auto const count = static_cast<long>(chunk.size());
        at(target, [&] { isAllZero(chunk) ? output.writeZeros(count) : output.write(chunk.data(), count); });
        size += chunk.size();
        progress_.addBytes(count);
        checkStop(context);
    }
    return size;
}

} // namespace foundation::storage::tool
