#include "driver/MainDriverFixture.h"

#include <getopt.h>
#include <pthread.h>

#include <sstream>

#include "driver/MainDriver.h"

namespace vantor::support {

FaultPoint& ThreadFault() {
    // Never destroyed: the wrapped call is made until the very end.
    static auto* const fault = new FaultPoint;
    return *fault;
}

MainDriverTest::MainDriverTest() {
    ThreadFault().Reset();
    root.MakeFolder("/plugins");
    root.MakeFolder("/bootbank");
    root.MakeFolder("/var/log");
}

MainDriverTest::~MainDriverTest() { ThreadFault().Reset(); }

int MainDriverTest::Run(std::vector<std::string> words) {
    words.insert(words.begin(), "vantor");
    std::vector<char*> arguments;
    arguments.reserve(words.size() + 1);
    for (std::string& word : words) {
        arguments.push_back(word.data());
    }
    arguments.push_back(nullptr);
    optind = 0;  // the command line parser starts afresh
    return MainDriver(static_cast<int>(words.size()), arguments.data()).Run();
}

int MainDriverTest::RunDirectory(std::vector<std::string> words) const {
    words.push_back("--plugin-directory=" + root.Path("/plugins"));
    return Run(std::move(words));
}

std::vector<std::string> MainDriverTest::ReportLines(const std::string& beginning) const {
    std::istringstream text(root.Read("/var/log/sysboot.log"));
    std::vector<std::string> lines;
    std::string line;
    while (std::getline(text, line)) {
        if (line.compare(0, beginning.size(), beginning) == 0) {
            lines.push_back(line);
        }
    }
    return lines;
}

}  // namespace vantor::support

extern "C" {

using ThreadBody = void* (*)(void*);

int __real_pthread_create(pthread_t* thread, const pthread_attr_t* attributes, ThreadBody body,
                          void* argument);

int __wrap_pthread_create(pthread_t* thread, const pthread_attr_t* attributes, ThreadBody body,
                          void* argument) {
    vantor::support::FaultPoint& fault = vantor::support::ThreadFault();
    return fault.Fails() ? fault.Error()
                         : __real_pthread_create(thread, attributes, body, argument);
}

}  // extern "C"
