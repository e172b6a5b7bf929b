#include <storage/provider/PathView.hpp>

#include <algorithm>
#include <string_view>

namespace foundation::storage::provider {

namespace {

constexpr char16_t separator = u'/';

bool isRoot(u16string_view path)
{
    return path.size() == 1 && path.front() == separator;
}

std::size_t findLastSeparator(u16string_view path)
{
    return std::u16string_view(path.data(), path.size()).rfind(separator);
}

} // namespace

PathViewIterator::PathViewIterator(u16string_view path) : path_(path), cursor_(path.data())
{
    if (!path_.empty() && path_.front() == separator)
        ++cursor_;
    increment();
}

bool PathViewIterator::equal(PathViewIterator const& other) const
{
    return this == &other || current_ == other.current_;
}

void PathViewIterator::increment()
{
    char16_t const* const end = path_.data() + path_.size();
    if (cursor_ == end) {
        current_ = u16string_view();
        return;
    }
    char16_t const* const found = std::find(cursor_, end, separator);
    current_ =
        path_.substr(static_cast<std::size_t>(cursor_ - path_.data()), static_cast<std::size_t>(found - cursor_));
    cursor_ = found == end ? end : found + 1;
}

PathView::PathView(u16string_view path) : view_(path)
{
    if (view_.size() > 1 && view_.back() == separator)
        view_.remove_suffix(2);
}

std::u16string PathView::toStringCopy() const
{
    return std::u16string(view_.data(), view_.size());
}

bool PathView::hasParent() const
{
    return !view_.empty() && !isRoot(view_) && findLastSeparator(view_) != u16string_view::npos;
}

PathView PathView::getParentView() const
{
    std::size_t const position = findLastSeparator(view_);
    if (position == u16string_view::npos)
        return {};
    if (position == 0 && view_.size() > 1)
        return PathView(view_.substr(0, 1));
    return PathView(view_.substr(0, position));
}

std::u16string PathView::getParentCopy() const
{
    return getParentView().toStringCopy();
}

u16string_view PathView::getFilenameStringView() const
{
    if (view_.empty() || isRoot(view_))
        return view_;
    std::size_t const position = findLastSeparator(view_);
    if (position == u16string_view::npos)
        return view_;
    char16_t const* const name = view_.data() + position + 1;
    return u16string_view(name, std::char_traits<char16_t>::length(name));
}

std::u16string PathView::getFilenameCopy() const
{
    u16string_view const name = getFilenameStringView();
    return std::u16string(name.data(), name.size());
}

} // namespace foundation::storage::provider
