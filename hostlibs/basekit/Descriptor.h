#ifndef VANTOR_BASEKIT_DESCRIPTOR_H
#define VANTOR_BASEKIT_DESCRIPTOR_H

namespace BaseKit::impl {

// Owns one open descriptor. Used by one thread.
class Descriptor {
public:
    Descriptor() = default;
    // Takes `opened` over; a negative one stands for none.
    explicit Descriptor(int opened) : number(opened) {}
    Descriptor(Descriptor&& other) noexcept : number(other.number) { other.number = -1; }
    Descriptor& operator=(Descriptor&& other) noexcept;
    ~Descriptor() { Close(); }

    bool IsOpen() const { return number >= 0; }
    // Negative when none is open; poll(2) passes such a one over.
    int Get() const { return number; }
    // Keeps errno.
    void Close();

private:
    int number = -1;
};

// `opened` itself, or a copy of it that is closed on exec and is none of the three standard
// descriptors. Negative, with errno set, when there can be no copy.
Descriptor AboveStandard(Descriptor opened);

// Both ends of a new pipe, closed on exec and none of the three standard descriptors. Only the read
// end does not block. Returns 0 or an errno value.
int OpenPipe(Descriptor& readEnd, Descriptor& writeEnd);

constexpr const char* nullDevice = "/dev/null";

// The null device, for reading; closed on exec and none of the three standard descriptors. Returns
// 0 or an errno value.
int OpenNullDevice(Descriptor& opened);

}  // namespace BaseKit::impl

#endif
