#include "driver/RunOnceRecord.h"

#include <fcntl.h>
#include <syslog.h>
#include <unistd.h>

#include <boost/iostreams/device/back_inserter.hpp>
#include <boost/iostreams/filter/gzip.hpp>
#include <boost/iostreams/filtering_stream.hpp>
#include <cerrno>
#include <cstring>

#include "io/FileDescriptor.h"

namespace vantor {

namespace {

constexpr const char* recordFile = "/bootbank/vantorbk.gz";

// Returns 0, or the errno of the call that failed.
int WriteFile(const char* path, const std::string& content) {
    FileDescriptor file(open(path, O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC | O_NOCTTY, 0666));
    if (!file.IsOpen()) {
        return errno;
    }
    for (std::size_t done = 0; done < content.size();) {
        const ssize_t size = write(file.Get(), content.data() + done, content.size() - done);
        if (size < 0 && errno != EINTR) {
            return errno;
        }
        done += size > 0 ? static_cast<std::size_t>(size) : 0;
    }
    return file.Close() == 0 ? 0 : errno;
}

}  // namespace

void WriteRunOnceRecord(const std::set<std::string>& runOnce) {
    // Compressed first and written afterwards: a compressor that writes by itself cannot tell why
    // its file did not take the bytes.
    if (const int error = WriteFile(recordFile, CompressRunOnceRecord(runOnce)); error != 0) {
        syslog(LOG_ERR, "unable to write run-once record (%s): %s", recordFile,
               std::strerror(error));
    }
}

std::string CompressRunOnceRecord(const std::set<std::string>& runOnce) {
    namespace io = boost::iostreams;
    constexpr int bufferSize = 4096;
    io::gzip_params parameters(io::zlib::default_compression, io::zlib::deflated, 15, 8,
                               io::zlib::default_strategy, "", "", 0);
    std::string compressed;
    io::filtering_ostream stream;
    stream.push(io::gzip_compressor(parameters, bufferSize));
    stream.push(io::back_inserter(compressed));
    stream << "vantor.run-once=";
    for (const std::string& key : runOnce) {
        stream << key << ',';
    }
    stream << '\n';
    stream.reset();
    return compressed;
}

}  // namespace vantor
