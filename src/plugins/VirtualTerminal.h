#ifndef VANTOR_PLUGINS_VIRTUALTERMINAL_H
#define VANTOR_PLUGINS_VIRTUALTERMINAL_H

namespace vantor {

// Brings virtual terminal `number` (from 1) of "/dev/console" to the front. Does nothing, silently,
// on a host without a console of that kind.
void SwitchToVirtualTerminal(int number);

}  // namespace vantor

#endif
