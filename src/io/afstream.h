#ifndef VANTOR_IO_AFSTREAM_H
#define VANTOR_IO_AFSTREAM_H

#include <fstream>
#include <string>

namespace vantor {

// An output file stream that never exposes a half-written file. Everything is written to a
// temporary file beside the destination; only commit() moves it over the destination, in one
// rename(2), so that readers see the old content or the whole new one, across a power cut too.
//
//   state      temporary file   leaves by
//   unopened   none             open() -> open; commit() throws
//   open       being written    commit() -> committed or failed; destructor -> abandoned
//   committed  moved            destructor
//   failed     closed, or gone  destructor removes what is left
//
// Used by one thread. Several streams may prepare the same destination at once, each with a
// temporary file of its own; the last rename wins.
class afstream : public std::basic_ofstream<char> {
public:
    afstream() = default;

    // Discards an uncommitted temporary file; the destination stays as it was. Never throws.
    ~afstream() override;

    afstream(const afstream&) = delete;
    afstream& operator=(const afstream&) = delete;

    // Creates the temporary file, mode 600, in the folder of `path` and opens the stream on it with
    // `mode` plus output. A temporary file of an earlier open() is discarded. Throws
    // std::runtime_error, with errno still that of the call that failed.
    void open(const char* path, std::ios_base::openmode mode = std::ios_base::out);

    // Moves the written file over the destination and gives it the permission bits that the
    // destination had (600 where there was none). Throws std::runtime_error:
    //  - when nothing was opened, or anything of the output could not be written or synchronised
    //    to the disk, or the rename failed: the destination is untouched;
    //  - when the permission bits could not be restored: the new content is in place.
    void commit();

private:
    void FlushToDisk();
    void Discard() noexcept;

    std::string tempName;  // empty until open() has created the file
    std::string destName;
};

}  // namespace vantor

#endif
