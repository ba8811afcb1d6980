#include "platform/core/Status.h"
#include "platform/core/Error.h"

#include <gtest/gtest.h>

#include <cerrno>

namespace {

using platform::Error;

TEST(Status, SystemErrorsMapByTheTable)
{
    const struct {
        int systemError;
        std::int32_t status;
    } cases[] = {
        {0, 0},          {EINTR, -27},   {ENOSPC, -34},    {EIO, -36},      {ENAMETOOLONG, -37}, {ENOMEM, -41},
        {ENFILE, -41},   {EMFILE, -42},  {ENOENT, -43},    {EBUSY, -47},    {ENOTEMPTY, -47},    {EEXIST, -48},
        {EINVAL, -50},   {EISDIR, -50},  {EBADF, -51},     {EROFS, -61},    {ECANCELED, -128},   {ENXIO, -1302},
        {EXDEV, -1303},  {EFBIG, -1309}, {ENOTDIR, -1407}, {EDQUOT, -1425}, {EACCES, -5000},     {EPERM, -5000},
        {ENOKEY, -5023}, {EPIPE, -36},   {-1, -36},        {99999, -36},
    };
    for (const auto& c : cases) {
        errno = c.systemError;
        EXPECT_EQ(PosixErrorToOSErr(), c.status) << c.systemError;
        EXPECT_EQ(PosixErrorToOSErr(c.systemError), c.status) << c.systemError;
    }
}

TEST(Status, AnApplicationErrorStandsForTheOneBelowIt)
{
    const auto error = [](const char* domain, std::int64_t code, std::shared_ptr<const Error> underlying = nullptr) {
        return std::make_shared<const Error>(Error{domain, code, "", std::move(underlying), {}});
    };
    const auto status = error(platform::ErrorDomain::status, -1407);
    const auto system = error(platform::ErrorDomain::system, ENOSPC);
    EXPECT_EQ(NSErrorToOSErr(nullptr), 0);
    EXPECT_EQ(NSErrorToOSErr(status.get()), -1407);
    EXPECT_EQ(NSErrorToOSErr(system.get()), -34);
    EXPECT_EQ(NSErrorToOSErr(error(platform::ErrorDomain::system, std::int64_t{1} << 32).get()), -36);
    const auto application = error(platform::ErrorDomain::application, 5, system);
    EXPECT_EQ(NSErrorToOSErr(application.get()), -34);
    EXPECT_EQ(NSErrorToOSErr(error(platform::ErrorDomain::application, 5).get()), -1);
    // One level only; an error below another domain is ignored.
    EXPECT_EQ(NSErrorToOSErr(error(platform::ErrorDomain::application, 5, application).get()), -1);
    EXPECT_EQ(NSErrorToOSErr(error("elsewhere", 5, status).get()), -1);
}

} // namespace
