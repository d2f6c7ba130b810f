#ifndef VANTOR_DRIVER_RUNONCERECORD_H
#define VANTOR_DRIVER_RUNONCERECORD_H

#include <set>
#include <string>

namespace vantor {

// Replaces "/bootbank/vantorbk.gz" by a gzip file (RFC 1952) of the one line "vantor.run-once=" and
// the keys in order, each followed by a comma. A failure goes to syslog (LOG_ERR) and never fails
// the run.
void WriteRunOnceRecord(const std::set<std::string>& runOnce);

// The bytes of that file.
std::string CompressRunOnceRecord(const std::set<std::string>& runOnce);

}  // namespace vantor

#endif
