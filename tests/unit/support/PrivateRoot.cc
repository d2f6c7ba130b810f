#include "support/PrivateRoot.h"

#include <dlfcn.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <boost/filesystem/operations.hpp>
#include <cstdarg>
#include <cstdio>
#include <cstring>

namespace vantor::support {

namespace {

// The beginnings of the program's fixed paths.
constexpr const char* fixedPaths[] = {
    "/bootbank/",       "/dev/console",    "/etc/init.d/nvevtd",   "/etc/nuvex/",
    "/etc/syslog.conf", "/usr/lib/nuvex/", "/var/log/sysboot.log", "/var/run/nuvex",
};

// Where fixed paths lie without a PrivateRoot: nowhere.
constexpr const char* nowhere = "/nonexistent";

const PrivateRoot* current = nullptr;

}  // namespace

PrivateRoot::PrivateRoot() { current = this; }

PrivateRoot::~PrivateRoot() { current = nullptr; }

bool PrivateRoot::Has(const std::string& fixedPath) const {
    struct stat status {};
    return lstat(Path(fixedPath).c_str(), &status) == 0;
}

std::string PrivateRoot::Read(const std::string& fixedPath) const {
    return ReadFile(Path(fixedPath));
}

void PrivateRoot::MakeFolder(const std::string& fixedPath) const {
    boost::filesystem::create_directories(Path(fixedPath));
}

void PrivateRoot::Write(const std::string& fixedPath, const std::string& content,
                        mode_t mode) const {
    MakeFolder(fixedPath.substr(0, fixedPath.rfind('/')));
    WriteFile(Path(fixedPath), content, mode);
}

void PrivateRoot::WriteScript(const std::string& fixedPath, const std::string& commands) const {
    Write(fixedPath, "#!/bin/sh\n" + commands, 0755);
}

std::string Redirect(const char* path) {
    for (const char* fixedPath : fixedPaths) {
        if (std::strncmp(path, fixedPath, std::strlen(fixedPath)) == 0) {
            return (current != nullptr ? current->Folder() : std::string(nowhere)) + path;
        }
    }
    return path;
}

FaultPoint& OpenFault() {
    // Never destroyed: the wrapped calls are made until the very end.
    static auto* const fault = new FaultPoint;
    return *fault;
}

FaultPoint& ExecFault() {
    static auto* const fault = new FaultPoint;
    return *fault;
}

}  // namespace vantor::support

using vantor::support::ExecFault;
using vantor::support::OpenFault;
using vantor::support::Redirect;

extern "C" {

int __real_open(const char* path, int flags, ...);
int __real_access(const char* path, int mode);
int __real_mkstemp(char* pattern);
int __real_rename(const char* from, const char* to);
int __real_stat(const char* path, struct stat* status);
int __real_chmod(const char* path, mode_t mode);
int __real_unlink(const char* path);
int __real_execve(const char* path, char* const* arguments, char* const* environment);

int __wrap_open(const char* path, int flags, ...) {
    mode_t mode = 0;
    if ((flags & O_CREAT) != 0) {
        va_list rest;
        va_start(rest, flags);
        mode = va_arg(rest, mode_t);
        va_end(rest);
    }
    return OpenFault().Fails() ? -1 : __real_open(Redirect(path).c_str(), flags, mode);
}

int __wrap_access(const char* path, int mode) {
    return __real_access(Redirect(path).c_str(), mode);
}

int __wrap_mkstemp(char* pattern) {
    std::string redirected = Redirect(pattern);
    const int descriptor = __real_mkstemp(redirected.data());
    // The random letters at the end are the answer, too.
    const std::size_t length = std::strlen(pattern);
    redirected.copy(pattern, length, redirected.size() - length);
    return descriptor;
}

int __wrap_rename(const char* from, const char* to) {
    return __real_rename(Redirect(from).c_str(), Redirect(to).c_str());
}

int __wrap_stat(const char* path, struct stat* status) {
    return __real_stat(Redirect(path).c_str(), status);
}

int __wrap_chmod(const char* path, mode_t mode) {
    return __real_chmod(Redirect(path).c_str(), mode);
}

int __wrap_unlink(const char* path) { return __real_unlink(Redirect(path).c_str()); }

int __wrap_execve(const char* path, char* const* arguments, char* const* environment) {
    return ExecFault().Fails() ? -1 : __real_execve(Redirect(path).c_str(), arguments, environment);
}

// The linker's wrappers do not reach into the C++ library; a definition in the program does. Its
// file streams open by this function.
// NOLINTNEXTLINE(readability-identifier-naming): the C library's name
FILE* fopen64(const char* path, const char* mode) {
    using Function = FILE* (*)(const char*, const char*);
    static const auto real = reinterpret_cast<Function>(dlsym(RTLD_NEXT, "fopen64"));
    return real(Redirect(path).c_str(), mode);
}

}  // extern "C"

// boost::filesystem::status(path, error), a function of C++ with a linker's name.
using boost::filesystem::file_status;
using boost::filesystem::path;
using boost::system::error_code;

#define STATUS_SYMBOL "_ZN5boost10filesystem6detail6statusERKNS0_4pathEPNS_6system10error_codeE"

file_status RealStatus(const path& file, error_code* error) __asm__("__real_" STATUS_SYMBOL);
file_status WrappedStatus(const path& file, error_code* error) __asm__("__wrap_" STATUS_SYMBOL);

file_status WrappedStatus(const path& file, error_code* error) {
    return RealStatus(Redirect(file.c_str()), error);
}
