#ifndef VANTOR_GRAPH_KEEPUNTILEXIT_H
#define VANTOR_GRAPH_KEEPUNTILEXIT_H

namespace vantor {

class Node;

// Notes a node that lives until the process ends: every plugin that was fully constructed, be it
// queued to run or not. The note keeps such nodes reachable to the very end, as the registry keeps
// barriers, so that a leak checker reports only what is really lost. Takes GlobalLock.
void KeepUntilExit(const Node& node);

}  // namespace vantor

#endif
