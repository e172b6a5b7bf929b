#include <tools/storage/Session.hpp>
#include <tools/storage/TargetOperand.hpp>
#include <tools/storage/TreeCopier.hpp>
#include <tools/storage/TreeRemover.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/describe.hpp>

#include <boost/date_time/posix_time/posix_time_types.hpp>
#include <memory>
#include <storage/provider/Exception.hpp>

namespace foundation::storage::tool {

namespace {

using boost::posix_time::microsec_clock;
using boost::posix_time::ptime;

struct Options
{
    std::vector<std::string> paths;
    bool replaces = false;
    bool isVerbose = false;
};

class Move
{
public:
    Move(Session& session, Options const& options, Place target);

    void move(Place const& source);

private:
    bool moveWithinStore(Place const& source, Kind kind, Place const& target) const;
    void moveByCopying(Place const& source, Kind kind, Place const& target);
    void moveFolderByCopying(Place const& source, Place const& target);

    Session& session_;
    Replace replace_;
    FileCopier files_;
    TreeCopier trees_;
    TargetOperand target_;
    bool isVerbose_;
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

Move::Move(Session& session, Options const& options, Place target)
    : session_(session),
      replace_(options.replaces ? Replace::Files : Replace::Never),
      files_(session, {replace_, false}),
      trees_(session, files_, FileLinks::Refuse),
      target_(std::move(target), options.paths.size() - 1),
      isVerbose_(options.isVerbose)
{}

void Move::move(Place const& source)
{
    Kind const kind = existingKindOf(source);
    requireMovable(source);
    Place const target = target_.targetOf(source);
    if (kind == Kind::RegularFolder)
        requireFolderTarget(target);
    else
        requireFileTarget(target, replace_);
    if (!moveWithinStore(source, kind, target))
        moveByCopying(source, kind, target);
    if (isVerbose_)
        session_.printName(source.text() + " -> " + target.text());
}

/// Answers whether the store can do it. What it refuses is told at the end of the move that it names.
bool Move::moveWithinStore(Place const& source, Kind kind, Place const& target) const
{
    using provider::ReplacementPolicy;
    if (!source.item().hasSameProviderInstance(target.item()))
        return false;
    provider::StorageIRI const to = target.item().getLocation();
    try {
        if (kind == Kind::RegularFolder)
            source.item().moveFolder(to, ReplacementPolicy::NoClobber);
        else
            source.item().moveFile(to, replace_ == Replace::Files ? ReplacementPolicy::Overwrite
                                                                  : ReplacementPolicy::NoClobber);
    } catch (provider::Exception const& error) {
        if (error.getErrorCode() == provider::ErrorCode::UnsupportedOperation)
            return false;
        rethrowAsFailure(error.getStorageIRI() == to ? target : source);
    }
    return true;
}

void Move::moveByCopying(Place const& source, Kind kind, Place const& target)
{
    if (kind == Kind::RegularFolder)
        return moveFolderByCopying(source, target);
    if (kind != Kind::RegularFile)
        throw Failure{source.text(), "a link or a special file, which cannot be moved to another store"};
    ptime const start = microsec_clock::universal_time();
    files_.copy(source, target);
    requireCopied(source, target, start);
    at(source, [&] { source.item().removeFile(); });
}

void Move::moveFolderByCopying(Place const& source, Place const& target)
{
    ptime const start = microsec_clock::universal_time();
    if (!trees_.copy(source, target))
        throw Failure{source.text(), "stays, because not all of it could be copied; what could is in " + target.text()};
    TreeRemover(session_).remove(source, target,
                                 [&](Place const& file, Place const& copy) { requireCopied(file, copy, start); });
}

void moveAll(Session& session, Options const& options)
{
    std::vector<std::string> sources = options.paths;
    Place target = session.stores().open(sources.back());
    sources.pop_back();
    Move move(session, options, std::move(target));
    session.forEachPlace(sources, [&](Place const& source) { move.move(source); });
}

} // namespace

Action defineMv(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addFlag(app, "--replace", options->replaces, "Replace files at the target; folders are never replaced");
    addFlag(app, "-v,--verbose", options->isVerbose, "Name what was moved");
    addOperands(app, "SOURCE... TARGET", "What to move, and the folder that receives it, or its new name", 2,
                options->paths);
    return [options](Session& session) { moveAll(session, *options); };
}

} // namespace foundation::storage::tool
