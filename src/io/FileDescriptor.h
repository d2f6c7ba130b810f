#ifndef VANTOR_IO_FILEDESCRIPTOR_H
#define VANTOR_IO_FILEDESCRIPTOR_H

namespace vantor {

// Owns one open descriptor and closes it, keeping errno, when it goes out of scope. Used by one
// thread.
class FileDescriptor {
public:
    // Takes over `opened`; a negative one stands for none, so that the result of a failed
    // open() can be handed straight in and asked for with IsOpen().
    explicit FileDescriptor(int opened) : descriptor(opened) {}
    ~FileDescriptor();
    FileDescriptor(const FileDescriptor&) = delete;
    FileDescriptor& operator=(const FileDescriptor&) = delete;

    bool IsOpen() const { return descriptor >= 0; }
    int Get() const { return descriptor; }

    // Closes now. Returns close(2)'s result, with its errno; 0 when nothing was open.
    int Close();

private:
    int descriptor;
};

}  // namespace vantor

#endif
