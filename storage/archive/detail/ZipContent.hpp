#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Content.hpp>
#include <storage/archive/detail/ZipArchive.hpp>

#include <cstdint>
#include <memory>

namespace foundation::storage::archive::detail {

/// The content of an entry of a zip.
class FOUNDATION_API ZipContent final : public Content
{
public:
    ZipContent(std::unique_ptr<ZipArchive::Lease> lease, std::uint64_t number, bool isStored);
    ~ZipContent() override;

    std::size_t read(char* buffer, std::size_t count) override;
    bool seek(std::uint64_t position) override;
    void restart() override;
    void finish() override;

private:
    std::unique_ptr<ZipArchive::Lease> lease_;
    std::uint64_t const number_;
    bool const isStored_;
    ZipHandle::File file_; ///< nothing after a failure to begin anew
};

} // namespace foundation::storage::archive::detail
