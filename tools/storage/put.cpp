#include <tools/storage/AtomicFile.hpp>
#include <tools/storage/FileCopier.hpp>
#include <tools/storage/PlainFile.hpp>
#include <tools/storage/Session.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/kinds.hpp>
#include <tools/storage/readSome.hpp>
#include <tools/storage/standardInput.hpp>

#include <memory>

namespace foundation::storage::tool {

namespace {

struct Options
{
    std::string target;
    bool replaces = false;
    bool isInPlace = false;
    bool isSynced = false;
};

std::unique_ptr<TargetFile> openTarget(Place const& target, Options const& options)
{
    Replace const replace = options.replaces ? Replace::Files : Replace::Never;
    requireFileTarget(target, replace);
    if (target.saysFolder())
        throw Failure{target.text(), "no such folder, and a file has no slash at the end"};
    requireParentFolder(target);
    return at(target, [&]() -> std::unique_ptr<TargetFile> {
        if (options.isInPlace)
            return std::make_unique<PlainFile>(target.item(), replace);
        return std::make_unique<AtomicFile>(target.item(), replace);
    });
}

/// Writes standard input piece by piece, and answers how much it was.
long writeInput(Session& session, Place const& target, TargetFile& output)
{
    std::vector<char> buffer = makeTransferBuffer();
    long size = 0;
    for (std::string_view chunk = readStandardInput(buffer); !chunk.empty(); chunk = readStandardInput(buffer)) {
        auto const count = static_cast<long>(chunk.size());
        at(target, [&] { output.write(chunk.data(), count); });
        size += count;
        session.progress().addBytes(count);
    }
    return size;
}

void put(Session& session, Options const& options)
{
    if (options.isSynced)
        session.stores().syncAll();
    Place const target = session.stores().open(options.target);
    std::unique_ptr<TargetFile> const output = openTarget(target, options);
    try {
        long const size = writeInput(session, target, *output);
        at(target, [&] { output->commit(size); });
    } catch (...) {
        if (!output->discard())
            session.complain({target.text(), output->leftover()});
        throw;
    }
}

} // namespace

Action definePut(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addFlag(app, "--replace", options->replaces, "Replace a file that is there already");
    addFlag(app, "--in-place", options->isInPlace,
            "Write into the file at the target itself: what fails half-way leaves half of it");
    addSyncFlag(app, options->isSynced);
    exclude(app, "--sync", "--in-place");
    addOperand(app, "TARGET", "The file that standard input becomes", options->target);
    return [options](Session& session) { put(session, *options); };
}

} // namespace foundation::storage::tool
