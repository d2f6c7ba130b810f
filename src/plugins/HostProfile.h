#ifndef VANTOR_PLUGINS_HOSTPROFILE_H
#define VANTOR_PLUGINS_HOSTPROFILE_H

namespace vantor {

// Whether the host has a configuration profile to apply: "/etc/nuvex/hostprofile.xml" or
// "/etc/nuvex/hostprofile.xml.gz", of whatever file type. Looked up by the first call and
// remembered for the life of the process, under GlobalLock.
bool HostProfilePresent();

}  // namespace vantor

#endif
