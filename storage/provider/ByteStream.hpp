#pragma once

#include <foundation/export.hpp>

#include <boost/noncopyable.hpp>

#include <ios>

namespace foundation::storage::provider {

/// The content of a file as a sequence of bytes that can be read, written, positioned and closed.
///
/// Counts and positions are in bytes. Failures are `ByteStreamFailure`s. Ownership: the caller's alone; a stream that
/// is destroyed unclosed gives up its resources and reports nothing, so whoever wrote closes. Threads: one at a time.
class FOUNDATION_API ByteStream : private boost::noncopyable
{
public:
    virtual ~ByteStream() = default;

    /// Reads up to `count` bytes, perhaps fewer; answers how many, and -1 when nothing can be read any more.
    long read(char* buffer, long count) { return doRead(buffer, count); }

    /// Writes up to `count` bytes, perhaps fewer; answers how many.
    long write(char const* data, long count) { return doWrite(data, count); }

    /// Moves to `offset` from the place that `direction` names; answers the new position from the start.
    long seek(long offset, std::ios_base::seekdir direction) { return doSeek(offset, direction); }

    /// Hands over what is still on its way and gives up the resources; reports a failure of either.
    void close() { doClose(); }

protected:
    /// Nothing has been checked. A stream that answers 0 for a count above 0 is broken: the end is -1.
    virtual long doRead(char* buffer, long count) = 0;
    virtual long doWrite(char const* data, long count) = 0;
    virtual long doSeek(long offset, std::ios_base::seekdir direction) = 0;
    virtual void doClose() = 0; ///< does nothing for a closed stream: a commit that is tried again closes again
};

} // namespace foundation::storage::provider
