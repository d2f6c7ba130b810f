#ifndef VANTOR_JSON_NVCLIDISPATCHER_H
#define VANTOR_JSON_NVCLIDISPATCHER_H

#include "platform/BaseKit.h"

namespace vantor {

// The one dispatcher of the management tool's commands, shared by all JSON plugins of a run. Made
// by the first command that is to be executed, destroyed at exit.
class NvcliDispatcher : public BaseKit::AutoCli::Dispatcher {
public:
    // Makes the tool's four command directories known. One that the framework refuses with a
    // standard exception is logged (LOG_ERR) and left out; anything else that it throws leaves
    // the constructor.
    NvcliDispatcher();

    ~NvcliDispatcher() override;

    // The dispatcher, owned by the process. Several threads may make the first call at once: one
    // builds it while the others wait. When building it throws, there is none, and the next call
    // tries again.
    static NvcliDispatcher* Instance();
};

}  // namespace vantor

#endif
