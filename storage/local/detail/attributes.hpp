#pragma once

#include <foundation/export.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/provider/FileAttributes.hpp>
#include <storage/provider/FolderAttributes.hpp>

#include <boost/date_time/posix_time/posix_time_types.hpp>

#include <ctime>
#include <memory>
#include <string>
#include <string_view>

namespace foundation::storage::local::detail {

/// A point in time with microseconds, rounded down; one that the result cannot hold becomes the nearest that it can.
FOUNDATION_API boost::posix_time::ptime toPtime(struct statx_timestamp const& time);

/// The other way round, for any time that is not special.
FOUNDATION_API timespec toTimespec(boost::posix_time::ptime const& time);

/// Where a folder is, for what is asked about its entries when it may not be open any more.
struct FolderPath
{
    std::shared_ptr<Root const> root;
    std::string path;

    std::string pathOf(std::string_view name) const;
};

/// `path`, or `name` in `folder`, is where writability is asked for, when somebody asks.
provider::FileAttributes toFileAttributes(Status const& status, std::shared_ptr<Root const> root, std::string path);
provider::FolderAttributes toFolderAttributes(Status const& status, std::shared_ptr<Root const> root, std::string path);
provider::FileAttributes toFileAttributes(Status const& status, std::shared_ptr<FolderPath const> folder,
                                          std::string_view name);
provider::FolderAttributes toFolderAttributes(Status const& status, std::shared_ptr<FolderPath const> folder,
                                              std::string_view name);

} // namespace foundation::storage::local::detail
