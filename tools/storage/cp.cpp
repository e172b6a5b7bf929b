#include <tools/storage/Session.hpp>
#include <tools/storage/TargetOperand.hpp>
#include <tools/storage/TreeCopier.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>

#include <memory>

namespace foundation::storage::tool {

namespace {

struct Options
{
    std::vector<std::string> paths;
    bool isRecursive = false;
    bool replaces = false;
    bool isVerbose = false;
};

class Copy
{
public:
    Copy(Session& session, Options const& options, Place target)
        : files_(session, {options.replaces ? Replace::Files : Replace::Never, options.isVerbose}),
          trees_(session, files_, FileLinks::Copy),
          target_(std::move(target), options.paths.size() - 1),
          isRecursive_(options.isRecursive)
    {}

    void copy(Place const& source)
    {
        Kind const kind = requireCopyable(source);
        if (kind == Kind::RegularFolder && !isRecursive_)
            throw Failure{source.text(), "a folder (-r copies folders and all they hold)"};
        Place const target = target_.targetOf(source);
        if (kind == Kind::RegularFolder)
            trees_.copy(source, target);
        else
            files_.copy(source, target);
    }

private:
    FileCopier files_;
    TreeCopier trees_;
    TargetOperand target_;
    bool isRecursive_;
};

void copyAll(Session& session, Options const& options)
{
    std::vector<std::string> sources = options.paths;
    Place target = session.stores().open(sources.back());
    sources.pop_back();
    Copy copy(session, options, std::move(target));
    session.forEachPlace(sources, [&](Place const& source) { copy.copy(source); });
}

} // namespace

Action defineCp(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addFlag(app, "-r,-R,--recursive", options->isRecursive, "Also copy folders, with all they hold");
    addFlag(app, "--replace", options->replaces, "Replace files at the target; folders are never replaced");
    addFlag(app, "-v,--verbose", options->isVerbose, "Name each file that was copied");
    addOperands(app, "SOURCE... TARGET", "What to copy, and the folder that receives it, or its new name", 2,
                options->paths);
    return [options](Session& session) { copyAll(session, *options); };
}

} // namespace foundation::storage::tool
