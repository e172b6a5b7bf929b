#include <storage/local/detail/copyFailure.hpp>

#include <storage/local/detail/errorCode.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/ReasonInfo.hpp>

namespace foundation::storage::local::detail {

using provider::StorageIRI;

namespace {

[[noreturn]] void throwAttributesFailed(int error, StorageIRI const& to)
{
    provider::Exception failure(toErrorCode(error), to);
    failure << provider::ReasonInfo(u"the extended attributes of its source cannot be kept there");
    throw failure;
}

} // namespace

void requireCopied(CopyResult const& result, StorageIRI const& from, StorageIRI const& to)
{
    switch (result.outcome) {
    case CopyOutcome::SourceFailed:
        throwError(result.error, from);
    case CopyOutcome::TargetFailed:
        throwError(result.error, to);
    case CopyOutcome::AttributesFailed:
        throwAttributesFailed(result.error, to);
    case CopyOutcome::Completed:
    case CopyOutcome::Aborted:
        break;
    }
}

} // namespace foundation::storage::local::detail
