#include "plugins/Exceptions.h"

#include <gtest/gtest.h>

#include <stdexcept>
#include <type_traits>

namespace vantor {
namespace {

TEST(ExceptionsTest, ExceptionAnswersWithTheWholeMessageUnchanged) {
    EXPECT_STREQ(Exception("what it is, %s and all\n").what(), "what it is, %s and all\n");
}

TEST(ExceptionsTest, ExceptionKeepsItsMessageWhenTheTextIsGone) {
    std::string text = "a message";
    const Exception exception(text);
    text = "another one";
    EXPECT_STREQ(exception.what(), "a message");
}

TEST(ExceptionsTest, ExceptionKeepsItsMessageWhenCopied) {
    const InvalidPluginException original("/p/libx.so", "too long to be kept in a small buffer");
    const Exception copy = original;
    EXPECT_STREQ(copy.what(),
                 "plugin `/p/libx.so' is invalid: too long to be kept in a small buffer");
}

TEST(ExceptionsTest, EmptyMessageStaysEmpty) { EXPECT_STREQ(Exception("").what(), ""); }

TEST(ExceptionsTest, NotImplementedNamesTheMethod) {
    EXPECT_STREQ(NotImplementedException("NativePlugin::ApplyHostProfile").what(),
                 "method `NativePlugin::ApplyHostProfile' is not implemented");
}

TEST(ExceptionsTest, InvalidPluginNamesThePathAndTheReason) {
    EXPECT_STREQ(InvalidPluginException("/p/libx.so", "Unsupported API version").what(),
                 "plugin `/p/libx.so' is invalid: Unsupported API version");
}

TEST(ExceptionsTest, InvalidPluginWithAnEmptyReasonEndsInABlank) {
    EXPECT_STREQ(InvalidPluginException("/p/libx.so", "").what(),
                 "plugin `/p/libx.so' is invalid: ");
}

template <typename Thrown>
std::string WhatAsStandardException(const Thrown& thrown) {
    try {
        throw thrown;
    } catch (const std::exception& exception) {
        return exception.what();
    }
}

TEST(ExceptionsTest, AllAreCaughtAsStandardExceptions) {
    EXPECT_EQ(WhatAsStandardException(Exception("plain")), "plain");
    EXPECT_EQ(WhatAsStandardException(NotImplementedException("m")),
              "method `m' is not implemented");
    EXPECT_EQ(WhatAsStandardException(InvalidPluginException("p", "r")),
              "plugin `p' is invalid: r");
}

TEST(ExceptionsTest, TheSpecialOnesAreExceptionsOfTheProgram) {
    EXPECT_TRUE((std::is_base_of_v<Exception, NotImplementedException>));
    EXPECT_TRUE((std::is_base_of_v<Exception, InvalidPluginException>));
    EXPECT_FALSE((std::is_base_of_v<std::runtime_error, Exception>));
}

}  // namespace
}  // namespace vantor
