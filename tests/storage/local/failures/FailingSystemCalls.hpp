#pragma once

#include <tests/storage/local/ReplacedSystemCalls.hpp>

#include <cstddef>
#include <functional>
#include <map>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

namespace foundation::tests::support {

/// A call that is about to be made.
struct SystemCall
{
    std::string_view name;               ///< of the member of the table
    std::size_t number = 0;              ///< among all, from 1
    std::size_t numberOfKind = 0;        ///< among those of that name, from 1
    std::vector<std::string> paths = {}; ///< what it works on; of a descriptor, the path of its file
    bool mayWrite = false;               ///< whether the descriptor it is given, if any, was opened for writing
};

/// What becomes of a call.
struct Fate
{
    static Fate asAlways() { return {}; }

    /// Not made at all; but `close` closes all the same, as it does on Linux.
    static Fate fails(int error) { return {.error = error}; }

    /// Reads, writes, copies or lists much less than it could.
    static Fate short_() { return {.isShort = true}; }

    int error = 0;
    bool isShort = false;
};

/// Has a plan decide over each call that this thread makes to the operating system, for as long as it lives.
///
/// Stands before every member of the table: a new one that is forgotten here does not compile.
class FailingSystemCalls
{
public:
    using Plan = std::function<Fate(SystemCall const&)>;

    explicit FailingSystemCalls(Plan plan = [](SystemCall const&) { return Fate::asAlways(); });
    ~FailingSystemCalls();

    /// The calls so far, of this thread.
    std::vector<SystemCall> const& calls() const { return calls_; }

    /// For the functions in the table.
    static Fate decide(SystemCall call);

private:
    ReplacedSystemCalls replaced_;
    Plan plan_;
    std::vector<SystemCall> calls_;
    std::map<std::string_view, std::size_t> countOfKind_;
    std::thread::id thread_ = std::this_thread::get_id();
};

/// The call of this number, and that call alone, has this fate.
FailingSystemCalls::Plan onlyCall(std::size_t number, Fate fate);

/// Every call has this fate. EINTR is for the calls that a signal can interrupt.
FailingSystemCalls::Plan everyCall(Fate fate);

/// Whether a signal can interrupt calls of that name.
bool isInterruptible(std::string_view name);

} // namespace foundation::tests::support
