#include <tools/storage/CopyRun.hpp>

#include <tools/storage/describe.hpp>
#include <tools/storage/format.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/transfers.hpp>

#include <fmt/format.h>
#include <utility>

namespace foundation::storage::tool {

namespace {

/// Throws `Failure` for what is not to be copied as a file.
void requireCopyableFile(Place const& source, FileLinks links)
{
    Kind const kind = requireCopyable(source);
    if (kind == Kind::SymlinkToFile && links == FileLinks::Refuse)
        throw Failure{source.text(), "a link, which would become a file"};
    if (kind == Kind::RegularFolder)
        throw Failure{source.text(), "became a folder meanwhile"};
}

std::string lineOf(Telling telling, Place const& source, Place const& target, CopiedFile const& file)
{
    if (telling == Telling::JSON)
        return toJSON(transferOf(source, target, file.wasUpToDate ? "skipped" : "copied", file.size));
    if (telling == Telling::Names && !file.wasUpToDate)
        return source.text() + " -> " + target.text();
    return {};
}

std::string counted(std::uint64_t count)
{
    return fmt::format("{} {}", count, count == 1 ? "file" : "files");
}

} // namespace

Kind requireCopyable(Place const& source)
{
    Kind const kind = existingKindOf(source);
    switch (kind) {
    case Kind::SymlinkToFolder:
        throw Failure{source.text(), "a link to a folder, not followed"};
    case Kind::BrokenSymlink:
        throw Failure{source.text(), "a broken link, not copied"};
    case Kind::SpecialFile:
        throw Failure{source.text(), "a special file, not copied"};
    case Kind::RegularFile:
    case Kind::SymlinkToFile:
    case Kind::RegularFolder:
    case Kind::None:
        break;
    }
    return kind;
}

CopyRun::CopyRun(Session& session, CopyRunOptions const& options)
    : session_(session),
      options_(options),
      files_(session.progress(), options.files),
      workers_(options.jobs, [this] { lookAround(); })
{}

void CopyRun::announce(std::vector<Place> sources)
{
    announced_ = std::move(sources);
}

/// Counting takes as long as some of the copying, and is worth that to whoever has to wait.
void CopyRun::lookAround()
{
    checkInterrupt();
    Progress& progress = session_.progress();
    progress.update();
    if (!announced_.empty() && progress.isSoon())
        counter_.emplace(session_.stores(), std::exchange(announced_, {}), progress);
}

void CopyRun::copyFile(Place source, Place target, TargetState state)
{
    ++asked_;
    lookAround();
    workers_.add([this, source = std::move(source), target = std::move(target), state](WorkerContext& context) {
        return copy(source, target, state, context);
    });
}

OrderedWorkers::Report CopyRun::copy(Place const& source, Place const& target, TargetState state,
                                     WorkerContext& context)
{
    try {
        requireCopyableFile(source, options_.links);
        CopiedFile const file = files_.copy(source, target, state, context);
        return [this, file, line = lineOf(options_.telling, source, target, file)] { record(file, line); };
    } catch (Failure const& failure) {
        return reportOf(failure, failedTransfer(source, target, failure));
    }
}

OrderedWorkers::Report CopyRun::reportOf(Failure failure, Transfer const& transfer)
{
    return [this, failure = std::move(failure),
            line = options_.telling == Telling::JSON ? toJSON(transfer) : std::string()] {
        isComplete_ = false;
        tell(line);
        session_.complain(failure);
    };
}

void CopyRun::fail(Place const& source, Place const& target, Failure const& failure)
{
    workers_.add(
        [report = reportOf(failure, failedTransfer(source, target, failure))](WorkerContext&) { return report; });
}

void CopyRun::fail(Failure const& failure)
{
    workers_.add([report = reportOf(failure, failedTransfer(failure))](WorkerContext&) { return report; });
}

void CopyRun::fail(Place const& source, Failure const& failure)
{
    workers_.add([report = reportOf(failure, failedTransfer(source, failure))](WorkerContext&) { return report; });
}

void CopyRun::record(CopiedFile const& file, std::string const& line)
{
    if (file.wasUpToDate) {
        ++upToDate_;
    } else {
        ++copied_;
        bytes_ += file.size;
    }
    tell(line);
}

void CopyRun::tell(std::string const& line)
{
    if (options_.telling == Telling::JSON)
        session_.printJSON(line);
    else if (!line.empty())
        session_.printName(line);
}

/// A report comes after those of all that was asked for before, which would change the time again.
void CopyRun::finishFolder(Place source, Place target, bool isNew)
{
    if (!isNew && !options_.files.keepsMetadata)
        return;
    FolderEnd const end{std::move(source), std::move(target), isNew, options_.files.keepsMetadata};
    workers_.add([this, end](WorkerContext&) { return [this, end] { report(end); }; });
}

void CopyRun::report(FolderEnd const& end)
{
    try {
        end.finish();
    } catch (Failure const& failure) {
        reportOf(failure, failedTransfer(end.source, end.target, failure))();
    }
}

bool CopyRun::finish()
{
    workers_.finish();
    // An interrupt may have left something, and come as that failure.
    if (!isComplete_)
        checkInterrupt();
    return std::exchange(isComplete_, true);
}

std::string CopyRun::stop(bool isAll)
{
    workers_.stop();
    std::optional<std::uint64_t> const all = isAll ? asked_ : session_.progress().allFiles();
    std::string const files = all ? fmt::format("{} of {}", copied_, counted(*all)) : counted(copied_);
    std::string const others = upToDate_ == 0 ? "" : fmt::format("; {} up to date before", counted(upToDate_));
    return fmt::format("{} copied, {}{}", files, formatSize(bytes_), others);
}

} // namespace foundation::storage::tool
