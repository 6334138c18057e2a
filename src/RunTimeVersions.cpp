// Keeps the plug-in loadable on sets whose run time libraries are older than those that it is built with:
// what would need a newer version of a symbol is bound to the oldest one, or defined here, where only the
// plug-in sees it. Without glibc, or on a machine that the table does not have, the newest versions are
// bound.
#include <cstdlib>
#include <new>
#include <vector>

#include <pthread.h>

// glibc 2.34 moved the threads into the C library under a new version; these are the versions before.
#if !defined(__GLIBC__)
#elif defined(__x86_64__) && defined(__LP64__)
#define OLD_THREADS "GLIBC_2.2.5"
#elif defined(__i386__)
#define OLD_THREADS "GLIBC_2.0"
#define OLD_THREAD_CREATION "GLIBC_2.1"
#elif defined(__aarch64__) && defined(__AARCH64EL__)
#define OLD_THREADS "GLIBC_2.17"
#elif defined(__arm__) && defined(__ARM_EABI__)
#define OLD_THREADS "GLIBC_2.4"
#elif defined(__mips__) && _MIPS_SIM == _ABIO32
#define OLD_THREADS "GLIBC_2.0"
#define OLD_THREAD_CREATION "GLIBC_2.2"
#endif
#if defined(OLD_THREADS) && !defined(OLD_THREAD_CREATION)
#define OLD_THREAD_CREATION OLD_THREADS
#endif

#ifdef OLD_THREADS

#define OLD_VERSION(function, name, version) __asm__(".symver " #function "," name "@" version)

extern "C" {

OLD_VERSION(oldCreate, "pthread_create", OLD_THREAD_CREATION);
int oldCreate(pthread_t* thread, const pthread_attr_t* attributes, void* (*function)(void*), void* argument);
OLD_VERSION(oldCancel, "pthread_cancel", OLD_THREADS);
int oldCancel(pthread_t thread);
OLD_VERSION(oldDetach, "pthread_detach", OLD_THREADS);
int oldDetach(pthread_t thread);
OLD_VERSION(oldTestCancel, "pthread_testcancel", OLD_THREADS);
void oldTestCancel();

int pthread_create(pthread_t* thread, const pthread_attr_t* attributes, void* (*function)(void*),
                   void* argument) noexcept {
    return oldCreate(thread, attributes, function, argument);
}

int pthread_cancel(pthread_t thread) {
    return oldCancel(thread);
}

int pthread_detach(pthread_t thread) noexcept {
    return oldDetach(thread);
}

// Not `noexcept`: a thread is cancelled by unwinding its stack.
void pthread_testcancel() {
    oldTestCancel();
}

// Of glibc 2.32. Zero is always right: reference counts then change atomically.
extern char __libc_single_threaded;
char __libc_single_threaded = 0;

} // extern "C"

#endif

#if defined(__GLIBCXX__) && !defined(TELIX_STATIC_LIBSTDCXX)

// Of the C++ run time of g++ 5. The browser may have replaced the other `delete`, which therefore is not
// defined here too.
#ifndef __clang__
#pragma GCC diagnostic ignored "-Wsized-deallocation"
#endif

void operator delete(void* block, size_t) noexcept {
    ::operator delete(block);
}

void operator delete[](void* block, size_t) noexcept {
    ::operator delete[](block);
}

// Of g++ 5 and 11. Both report a mistake of the program, which nothing catches.
namespace std {

void __throw_out_of_range_fmt(const char* format, ...) {
    __throw_out_of_range(format);
}

void __throw_bad_array_new_length() {
    __throw_bad_alloc();
}

} // namespace std

#endif
