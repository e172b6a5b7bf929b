#pragma once

#include <storage/provider/ByteStream.hpp>
#include <tools/storage/AtomicFile.hpp>
#include <tools/storage/Place.hpp>
#include <tools/storage/Session.hpp>

#include <vector>

namespace foundation::storage::tool {

struct CopyOptions
{
    Replace replace = Replace::Never;
    bool isVerbose = false;
};

/// Copies files one by one, each all-or-nothing.
class FileCopier
{
public:
    FileCopier(Session& session, CopyOptions const& options);

    CopyOptions const& options() const { return options_; }

    /// Throws `Failure` at the source or at the target, whichever it was, and `Interrupted`; the target is then as it
    /// was. A source that is a link is copied as the file that it leads to.
    void copy(Place const& source, Place const& target);

    /// The same without a look at the target first, for when it is known that nothing stands there. Should something
    /// appear after all, it is not replaced unless that was asked for.
    void copyToFreeTarget(Place const& source, Place const& target);

private:
    void transfer(Place const& source, Place const& target);
    long copyBytes(Place const& source, provider::ByteStream& input, Place const& target, AtomicFile& output);

    Session& session_;
    CopyOptions options_;
    std::vector<char> buffer_;
};

/// Throws `Failure` unless a file may be put at `target`: nothing stands there, or a file that may be replaced.
void requireFileTarget(Place const& target, Replace replace);

} // namespace foundation::storage::tool
