#include "boot/BootLog.h"

#include <array>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <limits>
#include <sstream>
#include <string_view>
#include <utility>

#include "boot/InputText.h"

namespace vantor::analyze {

namespace {

constexpr Microseconds microsecondsPerSecond = 1000000;
constexpr Microseconds secondsPerDay = 86400;

bool IsLeapYear(std::int64_t year) { return year % 4 == 0 && (year % 100 != 0 || year % 400 == 0); }

// From the first day of the year 1 to that of `year`, which is not negative.
std::int64_t DaysBeforeYear(std::int64_t year) {
    const std::int64_t passed = year - 1;
    if (passed < 0) {
        return -366;  // the year 0 is a leap year
    }
    return 365 * passed + passed / 4 - passed / 100 + passed / 400;
}

std::int64_t DaysInMonth(std::int64_t year, std::int64_t month) {
    constexpr std::array<std::int64_t, 12> days{31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    return days.at(static_cast<std::size_t>(month - 1)) + (month == 2 && IsLeapYear(year) ? 1 : 0);
}

// Reads a line from its start to its end; what does not fit ends the reading with an exception
// that tells the file, the line and what was expected.
class LineReader {
public:
    LineReader(std::istream& source, const std::string& name) : stream(source), path(name) {}

    // Goes to the next line; false at the end of the log.
    bool Next() {
        if (!std::getline(stream, line)) {
            if (stream.bad()) {
                throw std::runtime_error(path + ": cannot be read: " + std::strerror(errno));
            }
            return false;
        }
        ++number;
        rest = line;
        return true;
    }

    void Need(std::string_view text) {
        if (!Next()) {
            ++number;
            Fail("the log ends here, where a line that begins with \"" + std::string(text) +
                 "\" should follow");
        }
        Expect(text);
    }

    bool Starts(std::string_view text) const { return rest.substr(0, text.size()) == text; }

    void Expect(std::string_view text) {
        if (!Starts(text)) {
            Fail("expected \"" + std::string(text) + "\"" + Here());
        }
        rest.remove_prefix(text.size());
    }

    void ExpectEnd() const {
        if (!rest.empty()) {
            Fail("expected the end of the line" + Here());
        }
    }

    std::string TakeRest() { return std::string(std::exchange(rest, {})); }

    // Exactly so many digits.
    std::int64_t TakeDigits(std::size_t digits, const char* what) {
        std::int64_t value = 0;
        for (std::size_t count = 0; count < digits; ++count) {
            if (rest.empty() || rest.front() < '0' || rest.front() > '9') {
                Fail(std::string("expected ") + what + Here());
            }
            value = value * 10 + (rest.front() - '0');
            rest.remove_prefix(1);
        }
        return value;
    }

    std::int64_t TakeDigits(std::size_t digits, const char* what, std::int64_t least,
                            std::int64_t most) {
        const std::int64_t value = TakeDigits(digits, what);
        if (value < least || value > most) {
            Fail(std::string("there is no ") + what + " " + std::to_string(value));
        }
        return value;
    }

    // The rest of the line as a number.
    std::int64_t TakeNumber() {
        std::int64_t value = 0;
        const auto [end, error] = std::from_chars(rest.data(), rest.data() + rest.size(), value);
        if (error != std::errc() || end != rest.data() + rest.size()) {
            Fail("expected a number of 64 bits" + Here());
        }
        rest = {};
        return value;
    }

    bool NextIsDigit() const { return !rest.empty() && rest.front() >= '0' && rest.front() <= '9'; }

    [[noreturn]] void Fail(const std::string& reason) const {
        throw std::runtime_error(path + ":" + std::to_string(number) + ": " + reason);
    }

private:
    std::string Here() const {
        constexpr std::size_t most = 40;
        if (rest.empty()) {
            return " at the end of the line";
        }
        return ", not \"" + std::string(rest.substr(0, most)) +
               (rest.size() > most ? "...\"" : "\"") + " at column " +
               std::to_string(line.size() - rest.size() + 1);
    }

    std::istream& stream;
    const std::string& path;
    std::string line;
    std::string_view rest;  // of `line`
    int number = 0;
};

// A time as the boot program writes it, in UTC: years have four digits, or five from 10000 on.
Microseconds TakeTime(LineReader& line) {
    std::int64_t year = line.TakeDigits(4, "a year");
    if (line.NextIsDigit()) {
        year = year * 10 + line.TakeDigits(1, "a year");
    }
    line.Expect("-");
    const std::int64_t month = line.TakeDigits(2, "month", 1, 12);
    line.Expect("-");
    const std::int64_t day = line.TakeDigits(2, "day", 1, DaysInMonth(year, month));
    line.Expect(" ");
    const std::int64_t hours = line.TakeDigits(2, "hour", 0, 23);
    line.Expect(":");
    const std::int64_t minutes = line.TakeDigits(2, "minute", 0, 59);
    line.Expect(":");
    const std::int64_t seconds = line.TakeDigits(2, "second", 0, 59);
    line.Expect(".");
    const std::int64_t fraction = line.TakeDigits(6, "microseconds");

    std::int64_t days = DaysBeforeYear(year) - DaysBeforeYear(1970) + day - 1;
    for (std::int64_t passed = 1; passed < month; ++passed) {
        days += DaysInMonth(year, passed);
    }
    return (days * secondsPerDay + hours * 3600 + minutes * 60 + seconds) * microsecondsPerSecond +
           fraction;
}

bool TakeFlag(LineReader& line, std::string_view label) {
    line.Need(label);
    const std::int64_t flag = line.TakeDigits(1, "0 or 1");
    line.ExpectEnd();
    if (flag > 1) {
        line.Fail("expected 0 or 1");
    }
    return flag == 1;
}

Microseconds TakeMoment(LineReader& line, std::string_view label) {
    line.Need(label);
    const Microseconds moment = TakeTime(line);
    line.ExpectEnd();
    return moment;
}

LogEntry TakeEntry(LineReader& line) {
    LogEntry entry;
    line.Expect("[");
    entry.start = TakeTime(line);
    line.Expect(" - ");
    entry.end = TakeTime(line);
    line.Expect("] sysboot: ");
    entry.name = line.TakeRest();
    return entry;
}

}  // namespace

BootLog ParseBootLog(std::istream& stream, const std::string& path) {
    // What the lengths of all runs may add up to: whoever sums them up, or some of them, need not
    // think of overflow.
    constexpr Microseconds longest = std::numeric_limits<Microseconds>::max() / 4;
    BootLog log;
    LineReader line(stream, path);
    line.Need("NVKernel Initialization Time: ");
    log.kernelTime = line.TakeNumber();
    if (log.kernelTime < 0) {
        line.Fail("the kernel cannot have been up for less than no time");
    }
    constexpr std::string_view configuration = "=== Vantor configuration info ===";
    Microseconds work = 0;
    for (;;) {
        if (!line.Next()) {
            line.Fail("the log ends after this line, without \"" + std::string(configuration) +
                      "\"");
        }
        if (!line.Starts("[")) {
            break;
        }
        log.entries.push_back(TakeEntry(line));
        const Microseconds length = log.entries.back().end - log.entries.back().start;
        if (length > longest - work) {
            line.Fail("the runs up to here add up to over 70,000 years");
        }
        work += length > 0 ? length : 0;
    }
    line.Expect(configuration);
    line.ExpectEnd();
    log.start = TakeMoment(line, " Start: ");
    log.end = TakeMoment(line, " End: ");
    log.verbose = TakeFlag(line, " Verbose: ");
    log.parallel = TakeFlag(line, " Parallel: ");
    log.randomize = TakeFlag(line, " Randomize: ");
    log.interactive = TakeFlag(line, " Interactive Mode: ");
    line.Need(" Random Seed: ");
    log.seed = line.TakeNumber();
    if (line.Next()) {
        line.Fail("the log should end before this line");
    }
    return log;
}

BootLog ReadBootLog(const std::string& path) {
    std::istringstream stream(ReadInput(path));
    return ParseBootLog(stream, path);
}

}  // namespace vantor::analyze
