#include <storage/local/detail/copyFailure.hpp>

#include <storage/local/detail/errorCode.hpp>

namespace foundation::storage::local::detail {

using provider::StorageIRI;

void requireCopied(CopyResult const& result, StorageIRI const& from, StorageIRI const& to)
{
    switch (result.outcome) {
    case CopyOutcome::SourceFailed:
        throwError(result.error, from);
    case CopyOutcome::TargetFailed:
        throwError(result.error, to);
    case CopyOutcome::AttributesFailed:
        throwError(result.error, to, u"the extended attributes of its source cannot be kept there");
    case CopyOutcome::Completed:
    case CopyOutcome::Aborted:
        break;
    }
}

} // namespace foundation::storage::local::detail
