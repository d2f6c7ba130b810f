#include "plugins/InteractivePrompt.h"

#include <poll.h>
#include <syslog.h>
#include <termios.h>
#include <unistd.h>

#include <array>
#include <cctype>
#include <cerrno>
#include <iostream>

#include "driver/RunConfig.h"
#include "plugins/TroubleshootingShell.h"
#include "plugins/VirtualTerminal.h"

namespace vantor {

namespace {

constexpr int promptTerminal = 1;  // virtual terminal of the prompt
constexpr int bootTerminal = 11;   // virtual terminal of an unattended boot

constexpr int nameColour = 6;
constexpr int unchosenColour = 7;
constexpr const char* reset = "\033[0m";
constexpr const char* hideCursor = "\033[?25l";
constexpr const char* showCursor = "\033[?25h";

struct Choice {
    char key;
    const char* text;
    int colour;
};

constexpr std::array<Choice, 4> choices = {{
    {'c', "(c)ontinue", 5},
    {'e', "(e)xecute", 2},
    {'t', "(t)roubleshoot", 3},
    {'s', "(s)kip", 1},
}};

std::string Colour(int number) { return "\033[" + std::to_string(number + 30) + "m"; }

// The line of choices, those but `chosenKey` without their colour; 0: all in colour.
std::string ChoiceLine(char chosenKey) {
    std::string line;
    for (const Choice& choice : choices) {
        const bool coloured = chosenKey == 0 || chosenKey == choice.key;
        line += line.empty() ? "" : "\t";
        line += Colour(coloured ? choice.colour : unchosenColour) + choice.text + reset;
    }
    return line;
}

// Keys reach the program at once and unseen from construction to destruction. A standard input
// that is no terminal is reported and used as it is.
class KeyInput {
public:
    KeyInput() {
        Check(tcgetattr(STDIN_FILENO, &attributes), "unable to get terminal io state");
        attributes.c_lflag &= ~modeBits;
        Check(tcsetattr(STDIN_FILENO, TCSANOW, &attributes), "unable to set terminal io state");
    }

    ~KeyInput() {
        attributes.c_lflag |= modeBits;
        Check(tcsetattr(STDIN_FILENO, TCSANOW, &attributes), "unable to restore terminal io state");
    }

    KeyInput(const KeyInput&) = delete;
    KeyInput& operator=(const KeyInput&) = delete;

private:
    static constexpr tcflag_t modeBits = ICANON | ECHO;

    static void Check(int result, const char* complaint) {
        if (result != 0) {
            syslog(LOG_ERR, "%s", complaint);
        }
    }

    termios attributes{};
};

// The next byte of standard input. Read one at a time, past any buffer, so that what follows an
// answer is left for a troubleshooting shell. The end of the input counts as no answer, and one may
// still come: look again, but not in a busy loop.
char ReadKey() {
    constexpr int pauseMilliseconds = 50;
    char key = 0;
    for (;;) {
        const ssize_t size = read(STDIN_FILENO, &key, 1);
        if (size == 1) {
            return key;
        }
        if (size == 0 || errno != EINTR) {
            poll(nullptr, 0, pauseMilliseconds);
        }
    }
}

char ReadChoice() {
    for (;;) {
        const int key = std::tolower(static_cast<unsigned char>(ReadKey()));
        for (const Choice& choice : choices) {
            if (key == choice.key) {
                return choice.key;
            }
        }
    }
}

char Prompt(const std::string& pluginName) {
    std::cout << "current plugin: " << Colour(nameColour) << pluginName << "\n"
              << ChoiceLine(0) << std::flush << hideCursor << std::flush;
    char chosen = 0;
    {
        const KeyInput keyInput;
        chosen = ReadChoice();
    }
    std::cout << showCursor << std::flush << "\r" << ChoiceLine(chosen) << std::endl;
    return chosen;
}

// Returns false to skip the plugin.
bool Obey(char choice, const std::string& pluginName) {
    switch (choice) {
    case 'c':
        RunConfig::Instance().interactive = false;
        SwitchToVirtualTerminal(bootTerminal);
        return true;
    case 's':
        syslog(LOG_INFO, "skipping plugin %s (interactive mode request)", pluginName.c_str());
        return false;
    case 't':
        RunTroubleshootingShell();
        return true;
    default:
        return true;
    }
}

}  // namespace

bool PassInteractiveGate(const std::string& pluginName) {
    std::list<std::string>& awaited = RunConfig::Instance().interactiveModeRequires;
    if (awaited.empty()) {
        SwitchToVirtualTerminal(promptTerminal);
        return Obey(Prompt(pluginName), pluginName);
    }
    awaited.remove(pluginName);
    if (awaited.empty()) {
        SwitchToVirtualTerminal(promptTerminal);
    }
    return true;
}

}  // namespace vantor
