#include <tools/storage/CopyRun.hpp>
#include <tools/storage/Session.hpp>
#include <tools/storage/TargetOperand.hpp>
#include <tools/storage/TreeCopier.hpp>
#include <tools/storage/TreeRemover.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/copyOptions.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/explain.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/physicalPath.hpp>
#include <tools/storage/transfers.hpp>

#include <boost/date_time/posix_time/posix_time_types.hpp>
#include <cstdint>
#include <fmt/format.h>
#include <memory>
#include <optional>
#include <storage/local/interruptibleMoves.hpp>
#include <storage/provider/Exception.hpp>

namespace foundation::storage::tool {

namespace {

using boost::posix_time::microsec_clock;
using boost::posix_time::ptime;
using provider::ReplacementPolicy;

struct Options
{
    std::vector<std::string> paths;
    bool replaces = false;
    TransferOptions transfers;
};

class Move
{
public:
    Move(Session& session, Options const& options, Place target);

    void moveAll(std::vector<std::string> const& sources);

private:
    void moveArgument(std::string const& argument);
    void move(Place const& source);
    void moveLocal(Place const& source, Kind kind, Place const& target);
    bool moveWithinStore(Place const& source, Kind kind, Place const& target) const;
    bool moveByCopying(Place const& source, Kind kind, Place const& target);
    bool moveFileByCopying(Place const& source, Place const& target);
    void moveFolderByCopying(Place const& source, Place const& target);
    void tell(Place const& source, Place const& target);

    ReplacementPolicy policy() const
    {
        return replace_ == Replace::Files ? ReplacementPolicy::Overwrite : ReplacementPolicy::NoClobber;
    }

    Session& session_;
    Replace replace_;
    bool isSynced_;
    bool copies_ = false; ///< has copied what no store could move
    CopyRun run_;
    TreeCopier trees_;
    TargetOperand target_;
    Telling telling_;
    std::size_t moved_ = 0;
};

void requireMovable(Place const& source)
{
    std::u16string const name = source.item().getName();
    if (name == u"." || name == u".." || !source.item().hasParent())
        throw Failure{source.text(), "a folder that cannot be moved under this name"};
}

void requireFolderTarget(Place const& target)
{
    if (kindOf(target) != Kind::None)
        throw Failure{target.text(), "exists already, and a folder never replaces anything"};
}

/// The last look before the source goes: the copy is whole, and is a copy of what stands there now.
void requireCopied(Place const& source, Place const& copy, ptime const& start)
{
    if (kindOf(source) != Kind::RegularFile || kindOf(copy) != Kind::RegularFile)
        throw Failure{source.text(), "changed while it was moved, and stays"};
    auto const original = at(source, [&] { return source.item().getFileAttributes(); });
    auto const copied = at(copy, [&] { return copy.item().getFileAttributes(); });
    ptime const modified = original.getLastModified();
    bool const wasModified = modified > start && modified <= microsec_clock::universal_time();
    if (wasModified || original.getSize() != copied.getSize())
        throw Failure{source.text(), "changed while it was moved, and stays"};
}

/// What is moved there would be lost: the source is removed, and the copy goes with the command.
void requireLasting(Place const& target)
{
    provider::StorageIRI store = target.item().getLocation();
    while (store.hasInnerIRI())
        store = store.getInnerIRI();
    if (store.getScheme() == u"mem")
        throw Failure{target.text(), "goes when the command ends, so that nothing is moved there"};
}

/// What an end of a move fails with may lie in the folder that is moved.
Place placeOf(provider::StorageIRI const& location, Place const& source, Place const& target)
{
    provider::StorageIRI const from = source.item().getLocation();
    if (location == target.item().getLocation())
        return target;
    if (!from.isAncestorOf(location))
        return source;
    return source.child(location.getPath().substr(from.getPath().size() + 1));
}

/// A folder appears at its target when all of it is there; after that nothing fails but the removal of the source.
Failure failureOf(provider::Exception const& error, Place const& source, Kind kind, Place const& target)
{
    Place const place = placeOf(error.getStorageIRI(), source, target);
    std::string const reason = explain(error);
    bool const stays =
        kind == Kind::RegularFolder && place.text() != target.text() && kindOf(target) == Kind::RegularFolder;
    return {place.text(), stays ? reason + "; all that was moved is in " + target.text() : reason};
}

CopyRunOptions runOptions(Options const& options, Replace replace)
{
    CopyRunOptions result;
    result.files.replace = replace;
    result.files.keepsMetadata = true;
    result.links = FileLinks::Refuse;
    result.telling = options.transfers.isJSON ? Telling::JSON : Telling::Nothing;
    result.jobs = jobsOf(options.transfers);
    return result;
}

Move::Move(Session& session, Options const& options, Place target)
    : session_(session),
      replace_(options.replaces ? Replace::Files : Replace::Never),
      isSynced_(options.transfers.isSynced),
      run_(session, runOptions(options, replace_)),
      trees_(session.stores(), run_),
      target_(std::move(target), options.paths.size() - 1),
      telling_(tellingOf(options.transfers))
{}

/// Of several sources, some may be moved in one step, and it is not known which.
void Move::moveAll(std::vector<std::string> const& sources)
{
    if (sources.size() == 1 && session_.progress().isShown())
        run_.announce(placesOf(session_, sources));
    try {
        for (std::string const& source : sources)
            moveArgument(source);
    } catch (Interrupted const& interrupted) {
        std::string const copied = run_.stop(false);
        throw Interrupted{interrupted.signal,
                          fmt::format("{} of {} moved{}", moved_, sources.size(), copies_ ? "; " + copied : "")};
    }
}

void Move::moveArgument(std::string const& argument)
{
    std::optional<Place> source;
    try {
        source = session_.stores().open(argument);
        move(*source);
    } catch (Failure const& failure) {
        if (telling_ == Telling::JSON)
            session_.printJSON(toJSON(source ? failedTransfer(*source, failure) : failedTransfer(failure)));
        session_.complain(failure);
    }
}

void Move::move(Place const& source)
{
    Kind const kind = existingKindOf(source);
    requireMovable(source);
    Place const target = target_.targetOf(source);
    if (kind == Kind::RegularFolder)
        requireFolderTarget(target);
    else
        requireFileTarget(target, replace_);
    if (isLocal(source) && isLocal(target))
        moveLocal(source, kind, target);
    else if (!moveWithinStore(source, kind, target) && !moveByCopying(source, kind, target))
        return;
    ++moved_;
    tell(source, target);
}

void Move::tell(Place const& source, Place const& target)
{
    if (telling_ == Telling::JSON)
        session_.printJSON(toJSON(transferOf(source, target, "moved")));
    else if (telling_ == Telling::Names)
        session_.printName(source.text() + " -> " + target.text());
}

/// Answers whether the store can do it. What it refuses is told at the end of the move that it names.
bool Move::moveWithinStore(Place const& source, Kind kind, Place const& target) const
{
    if (!source.item().hasSameProviderInstance(target.item()))
        return false;
    provider::StorageIRI const to = target.item().getLocation();
    try {
        if (kind == Kind::RegularFolder)
            source.item().moveFolder(to, ReplacementPolicy::NoClobber);
        else
            source.item().moveFile(to, policy());
    } catch (provider::Exception const& error) {
        if (error.getErrorCode() == provider::ErrorCode::UnsupportedOperation)
            return false;
        rethrowAsFailure(error.getStorageIRI() == to ? target : source);
    }
    return true;
}

/// From one file system to another the store copies, which can be interrupted and tells how far it is.
void Move::moveLocal(Place const& source, Kind kind, Place const& target)
{
    local::MoveOptions options{.policy = policy(), .isSynced = isSynced_};
    options.observer.interrupt = [this] {
        run_.lookAround();
        return provider::InterruptSignal::Continue;
    };
    options.observer.onBytes = [this](std::uint64_t count) { session_.progress().addBytes(static_cast<long>(count)); };
    options.observer.onFile = [this] { session_.progress().addFile(); };
    provider::StorageIRI const from = source.item().getLocation();
    provider::StorageIRI const to = target.item().getLocation();
    try {
        if (kind == Kind::RegularFolder)
            local::moveFolderInterruptibly(from, to, options);
        else
            local::moveFileInterruptibly(from, to, options);
    } catch (provider::Exception const& error) {
        throw failureOf(error, source, kind, target);
    }
}

/// Answers whether it was moved; if not, that has been complained about.
bool Move::moveByCopying(Place const& source, Kind kind, Place const& target)
{
    copies_ = true;
    // The source goes: its copy must not be lost with the power.
    session_.stores().syncAll();
    session_.stores().keepMetadata();
    if (kind == Kind::RegularFile)
        return moveFileByCopying(source, target);
    if (kind != Kind::RegularFolder)
        throw Failure{source.text(), "a link or a special file, which cannot be moved to another store"};
    moveFolderByCopying(source, target);
    return true;
}

bool Move::moveFileByCopying(Place const& source, Place const& target)
{
    ptime const start = microsec_clock::universal_time();
    run_.copyFile(source, target, TargetState::Unknown);
    if (!run_.finish())
        return false;
    session_.stores().writeArchives(); // the source must not go before its copy is there to stay
    requireCopied(source, target, start);
    at(source, [&] { source.item().removeFile(); });
    return true;
}

void Move::moveFolderByCopying(Place const& source, Place const& target)
{
    ptime const start = microsec_clock::universal_time();
    trees_.copy(source, target);
    if (!run_.finish())
        throw Failure{source.text(), "stays, because not all of it could be copied; what could is in " + target.text()};
    session_.stores().writeArchives();
    TreeRemover(session_).remove(source, target,
                                 [&](Place const& file, Place const& copy) { requireCopied(file, copy, start); });
    if (kindOf(source) != Kind::None)
        throw Failure{source.text(),
                      "stays in part, because not all of it could be removed; it was copied to " + target.text()};
}

void moveAll(Session& session, Options const& options)
{
    if (options.transfers.isSynced)
        session.stores().syncAll();
    std::vector<std::string> sources = options.paths;
    Place target = session.stores().open(sources.back());
    sources.pop_back();
    requireLasting(target);
    if (options.transfers.showsProgress)
        session.progress().showLines();
    Move(session, options, std::move(target)).moveAll(sources);
}

} // namespace

Action defineMv(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addFlag(app, "--replace", options->replaces, "Replace files at the target; folders are never replaced");
    addTransferOptions(app, "Name what was moved", options->transfers);
    addOperands(app, "SOURCE... TARGET", "What to move, and the folder that receives it, or its new name", 2,
                options->paths);
    return [options](Session& session) { moveAll(session, *options); };
}

} // namespace foundation::storage::tool
