#include <storage/archive/ArchiveException.hpp>

#include <storage/provider/ReasonInfo.hpp>
#include <tests/support/printed.hpp>

#include <boost/exception/get_error_info.hpp>
#include <gtest/gtest.h>

#include <memory>

namespace foundation::storage::archive {

using namespace provider;
using tests::support::printed;
using Reason = ArchiveException::Reason;

namespace {

StorageIRI const location(u"zip:file:///a.zip!/b");

TEST(ArchiveException, SaysWhatIsWrongWithWhat)
{
    ArchiveException const error(Reason::Encrypted, location);
    EXPECT_EQ(error.getReason(), Reason::Encrypted);
    EXPECT_EQ(error.getErrorCode(), ErrorCode::PermissionDenied);
    EXPECT_EQ(error.getStorageIRI(), location);
    EXPECT_STREQ(error.what(), "foundation::storage::archive::ArchiveException");
    EXPECT_EQ(error.ToUstringImpl(), u"Cannot read \"zip:file:///a.zip!/b\": encrypted.");
    EXPECT_EQ(*boost::get_error_info<ReasonInfo>(error), u"encrypted");
}

TEST(ArchiveException, OfAFailedStoreHasTheCodeOfTheStore)
{
    EXPECT_EQ(ArchiveException(Reason::StoreFailed, ErrorCode::ResourceInUse, location).getErrorCode(),
              ErrorCode::ResourceInUse);
}

TEST(ArchiveException, EveryReasonHasACodeAndAName)
{
    struct Row
    {
        Reason reason;
        ErrorCode code;
        char const* name;
    };
    for (Row const& row : {Row{Reason::NotAnArchive, ErrorCode::IOError, "Reason::NotAnArchive"},
                           {Reason::Damaged, ErrorCode::IOError, "Reason::Damaged"},
                           {Reason::Changed, ErrorCode::IOError, "Reason::Changed"},
                           {Reason::Encrypted, ErrorCode::PermissionDenied, "Reason::Encrypted"},
                           {Reason::UnsupportedMethod, ErrorCode::UnsupportedOperation, "Reason::UnsupportedMethod"},
                           {Reason::TooManyEntries, ErrorCode::FileTooLarge, "Reason::TooManyEntries"},
                           {Reason::IndexTooLarge, ErrorCode::FileTooLarge, "Reason::IndexTooLarge"},
                           {Reason::NestedTooDeep, ErrorCode::InvalidLocation, "Reason::NestedTooDeep"},
                           {Reason::EntryTooLarge, ErrorCode::FileTooLarge, "Reason::EntryTooLarge"},
                           {Reason::RatioTooHigh, ErrorCode::FileTooLarge, "Reason::RatioTooHigh"},
                           {Reason::SpoolTooLarge, ErrorCode::FileTooLarge, "Reason::SpoolTooLarge"},
                           {Reason::NotWritten, ErrorCode::IOError, "Reason::NotWritten"},
                           {Reason::StoreFailed, ErrorCode::IOError, "Reason::StoreFailed"},
                           {static_cast<Reason>(99), ErrorCode::Unknown, "Unhandled Reason"}})
    {
        EXPECT_EQ(printed(row.reason), row.name);
        EXPECT_EQ(errorCodeOf(row.reason), row.code) << row.name;
    }
}

TEST(ArchiveException, IsClonedAndRethrownAsWhatItIs)
{
    ArchiveException const error(Reason::Damaged, location);
    std::unique_ptr<core::except::IException> const clone(error.clone());
    EXPECT_EQ(dynamic_cast<ArchiveException&>(*clone).getReason(), Reason::Damaged);
    EXPECT_THROW(clone->rethrow(), ArchiveException);
}

} // namespace

} // namespace foundation::storage::archive
