// Codes, and values or codes, as they travel inside the library.
#include "core/detail/result.h"

#include "support/test.h"

namespace {

using tavo::Code;
using tavo::Result;

Result<std::unique_ptr<int>> Half(int number)
{
    if (number % 2)
        return Code(ERR_BAD_PARAMETERS);
    return std::make_unique<int>(number / 2);
}

TEST(Result, HasAValueOrACode)
{
    Result<std::unique_ptr<int>> half = Half(8);
    ASSERT_TRUE(half);
    EXPECT_EQ(**half, 4);
    EXPECT_EQ(half.Failure(), 0);
    EXPECT_FALSE(Half(7));
    EXPECT_EQ(Half(7).Failure(), ERR_BAD_PARAMETERS);
}

TEST(Result, RenamesOneCode)
{
    EXPECT_EQ(Code(ERR_BAD_PARAMETERS).Renaming(ERR_BAD_PARAMETERS, ERR_NO_SUCH_USER), ERR_NO_SUCH_USER);
    EXPECT_EQ(Code(ERR_OPEN_FAILED).Renaming(ERR_BAD_PARAMETERS, ERR_NO_SUCH_USER), ERR_OPEN_FAILED);
    EXPECT_EQ(Code().Renaming(ERR_BAD_PARAMETERS, ERR_NO_SUCH_USER), 0);
    EXPECT_EQ(Half(7).Renaming(ERR_BAD_PARAMETERS, ERR_NO_SUCH_USER).Failure(), ERR_NO_SUCH_USER);
    EXPECT_EQ(**Half(8).Renaming(ERR_BAD_PARAMETERS, ERR_NO_SUCH_USER), 4);
}

}  // namespace
