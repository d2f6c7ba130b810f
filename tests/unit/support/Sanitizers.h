#ifndef VANTOR_SUPPORT_SANITIZERS_H
#define VANTOR_SUPPORT_SANITIZERS_H

// gcc says it with a macro, clang answers a question.
#if defined(__has_feature)
#if __has_feature(address_sanitizer)
#define VANTOR_ADDRESS_SANITIZER
#endif
#if __has_feature(thread_sanitizer)
#define VANTOR_THREAD_SANITIZER
#endif
#endif
#if defined(__SANITIZE_ADDRESS__)
#define VANTOR_ADDRESS_SANITIZER
#endif
#if defined(__SANITIZE_THREAD__)
#define VANTOR_THREAD_SANITIZER
#endif

namespace vantor::support {

// Whether the test is built with a sanitizer that makes it many times slower. Tests that repeat
// something at random repeat it less often there.
#if defined(VANTOR_ADDRESS_SANITIZER) || defined(VANTOR_THREAD_SANITIZER)
constexpr bool underSanitizers = true;
#else
constexpr bool underSanitizers = false;
#endif

}  // namespace vantor::support

#endif
