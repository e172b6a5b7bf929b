#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Content.hpp>
#include <storage/archive/detail/Cursor.hpp>
#include <storage/archive/detail/CursorArchive.hpp>

#include <cstdint>
#include <memory>

namespace foundation::storage::archive::detail {

/// The content of an entry, by a cursor that nobody else has meanwhile.
class FOUNDATION_API CursorContent final : public Content
{
public:
    CursorContent(std::shared_ptr<CursorArchive const> archive, std::uint64_t number, std::uint64_t size);
    ~CursorContent() override;

    std::size_t read(char* buffer, std::size_t count) override;
    bool seek(std::uint64_t /*position*/) override { return false; }
    void restart() override;
    void finish() override;

private:
    void giveBack() noexcept;

    std::shared_ptr<CursorArchive const> archive_;
    std::uint64_t const number_;
    std::uint64_t const size_;
    std::unique_ptr<Cursor> cursor_; ///< nothing after a failure
};

} // namespace foundation::storage::archive::detail
