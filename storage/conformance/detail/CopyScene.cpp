#include <storage/conformance/detail/CopyScene.hpp>

#include <storage/conformance/detail/describe.hpp>
#include <storage/provider/InterruptSignal.hpp>

#include <exception>
#include <ostream>
#include <utility>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

InterruptSignal goOn()
{
    return InterruptSignal::Continue;
}

bool isScratch(std::u16string const& path)
{
    return path.ends_with(u".tmp.bak");
}

} // namespace

CopyFileOptions CopyMode::options(ReplacementPolicy policy) const
{
    return {policy, transaction, interruptible ? IProvider::Interrupt(goOn) : IProvider::Interrupt()};
}

std::ostream& operator<<(std::ostream& stream, CopyMode const& mode)
{
    return stream << mode.transaction << (mode.interruptible ? ", interruptible" : ", not interruptible");
}

IProvider::Interrupt interruptAt(int n, int& asked)
{
    return [n, &asked] { return ++asked == n ? InterruptSignal::Abort : InterruptSignal::Continue; };
}

CopyScene::CopyScene(Harness const& source, Harness const& destination, std::string content)
    : content_(std::move(content)), source_(source, {{u"from", content_}}), owned_(std::make_unique<Scene>(destination))
{}

CopyScene::CopyScene(Harness const& both, std::string content)
    : content_(std::move(content)), source_(both, {{u"from", content_}})
{}

void CopyScene::prepare(Tree const& before)
{
    before_ = before;
    if (!before.contains(u"to") && destination().provider().fileExists(destination().iri(u"to")))
        to().removeFile();
    for (auto const& [path, content] : before)
        destination().write(path, content);
}

testing::AssertionResult CopyScene::isUntouched() const
{
    return holds(before_);
}

testing::AssertionResult CopyScene::isCopiedUpTo(std::size_t size) const
{
    Tree after = before_;
    after[u"to"] = content_.substr(0, size);
    return holds(after);
}

testing::AssertionResult CopyScene::hasNothingElse() const
{
    Tree after = before_;
    if (destination().provider().fileExists(destination().iri(u"to")))
        after[u"to"] = destination().read(u"to");
    return holds(after);
}

void CopyScene::removeScratchFiles() const
{
    for (auto const& [path, content] : destination().tree()) {
        if (isScratch(path))
            destination().provider().removeFile(destination().iri(path));
    }
}

testing::AssertionResult CopyScene::holds(Tree const& destination) const
{
    Tree all = destination;
    if (!owned_)
        all[u"from"] = content_;
    testing::AssertionResult const held = source_.holds(owned_ ? Tree{{u"from", content_}} : all);
    return held && owned_ ? owned_->holds(all) : held;
}

std::array<Tree, 2> const copyDestinations{Tree{{u"other", "other"}, {u"to", "old"}}, Tree{{u"other", "other"}}};

testing::AssertionResult CopyOutcome::is(TransactionStatus expected) const
{
    if (status == expected)
        return testing::AssertionSuccess();
    return testing::AssertionFailure() << "the copy ended by " << text << ", expected " << expected;
}

testing::AssertionResult CopyOutcome::is(std::optional<CopyFailure> const& expected) const
{
    if (!expected)
        return is(TransactionStatus::Completed);
    StorageIRI const location = failure ? failure->getStorageIRI() : expected->location;
    bool const isBeside = expected->beside && location.getParent() == expected->location.getParent();
    if (failure && failure->getErrorCode() == expected->code && (isBeside || location == expected->location))
        return testing::AssertionSuccess();
    return testing::AssertionFailure() << "the copy ended by " << text << ", expected an Exception with "
                                       << expected->code << " naming " << expected->location
                                       << (expected->beside ? " or a file beside it" : "");
}

CopyOutcome copied(StorageItem const& from, StorageItem const& to, CopyFileOptions const& options)
{
    try {
        TransactionStatus const status = from.copyFile(to, options);
        return {.status = status, .text = testing::PrintToString(status)};
    } catch (Exception const& error) {
        return {.failure = error, .text = describe(std::current_exception())};
    } catch (...) {
        return {.text = describe(std::current_exception())};
    }
}

} // namespace foundation::storage::conformance::detail
