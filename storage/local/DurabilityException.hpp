#pragma once

#include <foundation/export.hpp>
#include <storage/provider/Exception.hpp>

#include <string>

namespace foundation::storage::local {

/// A change took place, and everybody sees it, but the disk did not confirm it: it may be undone by a power failure.
///
/// Thrown by a commit, an atomic copy, a move or the making of a folder whose last step failed, the sync of the folder.
/// Neither success nor "nothing happened": what was replaced is gone. A transactional stream that was closed in vain
/// can be closed again, which repeats that step alone; aborting it removes nothing.
///
/// `what` is the class name alone; `ToUstringImpl` names location and code and says the above, as its `ReasonInfo`
/// does.
class FOUNDATION_API DurabilityException : public provider::Exception
{
public:
    /// `target` is the location where the change took place.
    DurabilityException(provider::ErrorCode const& code, provider::StorageIRI const& target);

    core::except::IException* clone() const override;
    [[noreturn]] void rethrow() const override;
    char const* what() const noexcept override;
    std::u16string ToUstringImpl() const override;
};

} // namespace foundation::storage::local
