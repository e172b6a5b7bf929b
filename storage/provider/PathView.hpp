#pragma once

#include <foundation/export.hpp>

#include <boost/iterator/iterator_facade.hpp>
#include <boost/utility/string_view.hpp>

#include <string>

namespace foundation::storage::provider {

using u16string_view = boost::basic_string_view<char16_t>;

/// Walks the components of a '/'-separated path, without allocating.
///
/// Two iterators are equal when the components they stand on have the same text, wherever those lie. The end stands
/// on an empty component, so that a walk ends at the first empty component (of a doubled '/').
/// Valid while the text it was made from lives.
class FOUNDATION_API PathViewIterator
    : public boost::iterator_facade<PathViewIterator, u16string_view, boost::forward_traversal_tag, u16string_view>
{
public:
    /// The end of every path.
    PathViewIterator() = default;

    /// Stands on the first component of `path`; a leading '/' is skipped.
    explicit PathViewIterator(u16string_view path);

private:
    friend class boost::iterator_core_access;

    u16string_view dereference() const { return current_; }
    bool equal(PathViewIterator const& other) const;
    void increment();

    u16string_view path_;
    char16_t const* cursor_ = nullptr;
    u16string_view current_;
};

/// A non-owning view over a '/'-separated path in UTF-16; nothing is unescaped.
///
/// Made for paths as locations hold them: absolute, without a trailing '/' except for the root.
/// Valid while the text it was made from lives. Only the operations that answer a copy allocate.
class FOUNDATION_API PathView
{
public:
    using iterator = PathViewIterator;
    using const_iterator = PathViewIterator;

    PathView() = default;

    /// Views `path`; of a text longer than one code unit that ends with '/', the last two code units are left out.
    explicit PathView(u16string_view path);

    u16string_view toStringView() const { return view_; }
    std::u16string toStringCopy() const;

    /// Whether the path begins with '/' or holds one further on; false for the empty path and the root.
    bool hasParent() const;

    /// What stands before the last '/', or the root for a path directly below it; empty when there is none.
    PathView getParentView() const;
    std::u16string getParentCopy() const;

    /// What follows the last '/', up to the first NUL; so the viewed text must be NUL-terminated, as the text of every
    /// `std::u16string` is, and may reach past the end of the view. The root's name is "/".
    u16string_view getFilenameStringView() const;
    std::u16string getFilenameCopy() const;

    PathViewIterator begin() const { return PathViewIterator(view_); }
    PathViewIterator end() const { return {}; }
    PathViewIterator cbegin() const { return begin(); }
    PathViewIterator cend() const { return {}; }

private:
    u16string_view view_;
};

} // namespace foundation::storage::provider
