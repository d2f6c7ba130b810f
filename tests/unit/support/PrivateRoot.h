#ifndef VANTOR_SUPPORT_PRIVATEROOT_H
#define VANTOR_SUPPORT_PRIVATEROOT_H

#include <sys/types.h>

#include <string>

#include "support/FaultPoint.h"
#include "support/TempFolder.h"

namespace vantor::support {

// A place of the test's own for the fixed paths of the program ("/etc/nuvex/..." and the like); one
// at a time. A test program linked with the library test_private_root finds its fixed paths here
// and never on the machine: without a PrivateRoot they do not exist. Seen are the calls of our own
// objects and the files that the C++ library opens.
class PrivateRoot {
public:
    PrivateRoot();
    ~PrivateRoot();
    PrivateRoot(const PrivateRoot&) = delete;
    PrivateRoot& operator=(const PrivateRoot&) = delete;

    // The top of the place. Folders for other uses may be made in it.
    const std::string& Folder() const { return folder.Path(); }

    // Where a fixed path, or a path below one, really lies.
    std::string Path(const std::string& fixedPath) const { return Folder() + fixedPath; }

    bool Has(const std::string& fixedPath) const;
    std::string Read(const std::string& fixedPath) const;

    // Creates the folder and those above it.
    void MakeFolder(const std::string& fixedPath) const;

    // Writes the file, in a folder made for it.
    void Write(const std::string& fixedPath, const std::string& content, mode_t mode = 0644) const;

    // Writes an executable shell script.
    void WriteScript(const std::string& fixedPath, const std::string& commands) const;

private:
    TempFolder folder;
};

// The path that a call made with `path` is really made with.
std::string Redirect(const char* path);

// Asked once for each open(2) and execve(2) of our own objects. Whoever plans something resets it.
FaultPoint& OpenFault();
FaultPoint& ExecFault();

}  // namespace vantor::support

#endif
