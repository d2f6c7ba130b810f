#ifndef VANTOR_SUPPORT_STREAMCAPTURE_H
#define VANTOR_SUPPORT_STREAMCAPTURE_H

#include <ostream>
#include <sstream>
#include <string>

namespace vantor::support {

// Takes what is written to a stream, std::cout say, while this object lives. For one thread.
class StreamCapture {
public:
    explicit StreamCapture(std::ostream& captured)
        : stream(captured), previous(captured.rdbuf(text.rdbuf())) {}
    ~StreamCapture() { stream.rdbuf(previous); }
    StreamCapture(const StreamCapture&) = delete;
    StreamCapture& operator=(const StreamCapture&) = delete;

    std::string Text() const { return text.str(); }

private:
    std::ostringstream text;
    std::ostream& stream;
    std::streambuf* previous;
};

}  // namespace vantor::support

#endif
