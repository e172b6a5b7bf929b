#pragma once

#include <boost/exception/exception.hpp>

#include <atomic>
#include <string>

#include <foundation/export.hpp>

namespace foundation::core::except {

namespace detail {

/// A text made on first use that belongs to one object: copies of the object start without it.
///
/// Threads: `get` and `keepFirst` may be called by any number of threads at once.
class FOUNDATION_API OwnText
{
public:
    OwnText() noexcept = default;
    OwnText(OwnText const& /*other*/) noexcept {}
    OwnText& operator=(OwnText const& /*other*/) noexcept;
    ~OwnText();

    /// The text kept, or null while there is none.
    [[nodiscard]] std::string const* get() const noexcept { return text_.load(std::memory_order_acquire); }

    /// Keeps `text` unless another thread was faster, and answers the text that is kept.
    std::string const& keepFirst(std::string text);

private:
    std::atomic<std::string const*> text_{nullptr};
};

} // namespace detail

/// The interface that every exception of this system offers beside its standard base.
///
/// A concrete exception derives from an interface of this family and from a standard exception, as the class template
/// `Exception` arranges. The order of the virtual functions is part of the interface. `boost::exception` is a virtual
/// base so that its destructor does not come before them.
///
/// Ownership: copies share the Boost error-information entries; entries attached to one copy show in all of them, once
/// the original holds at least one.
/// Threads: any number of threads may read one exception. Attaching entries and copying (so `clone` and `rethrow` too)
/// need the callers' own lock, also between copies that share entries: Boost counts the holders without one.
class FOUNDATION_API IException : public virtual boost::exception
{
public:
    /// A copy of the same dynamic type on the heap, which the caller owns. It shares the error-information entries.
    [[nodiscard]] virtual IException* clone() const = 0;

    /// Throws a copy of the same dynamic type, which shares the error-information entries.
    [[noreturn]] virtual void rethrow() const = 0;

    ~IException() noexcept override;

    /// `ToUstringImpl()` in UTF-8, made on the first call and kept.
    ///
    /// Ownership: the text lives as long as this object.
    /// Threads: safe from any number of threads.
    /// Errors: none; when the text cannot be made, a fixed text takes its place.
    [[nodiscard]] virtual char const* what() const noexcept;

    /// The text as it is.
    [[nodiscard]] virtual std::u16string convert_str(std::u16string const& text) const;

    /// The UTF-16 form of UTF-8 text; malformed bytes become U+FFFD, because a text about an error must not raise
    /// another.
    [[nodiscard]] virtual std::u16string convert_str(std::string const& text) const;

    /// The full diagnostic text.
    ///
    /// Meaning: here the UTF-16 form of what the standard exception says that this object also is; without one, the
    /// name of its type. A `what` that forwards to `IException::what` does not lead back here for ever: the text is
    /// then that of the innermost standard class.
    [[nodiscard]] virtual std::u16string ToUstringImpl() const;

protected:
    IException() = default;
    IException(IException const&) = default;
    IException& operator=(IException const&) = default;

private:
    mutable detail::OwnText what_;
};

} // namespace foundation::core::except
