#ifndef VANTOR_ANALYZE_TESTS_BOOTTEXT_H
#define VANTOR_ANALYZE_TESTS_BOOTTEXT_H

#include <initializer_list>
#include <string>

#include "boot/BootLog.h"
#include "boot/BootTimeline.h"
#include "model/BootModel.h"

namespace vantor::support {

// A boot written as a few lines, in the order of its log, for tests:
//
//   BootText boot({"disks 0 50 provides storage", "look 60 90 requires storage"});
//
// Numbers are the start and the end of the run, in microseconds since the boot began. In their
// place may stand
//   idle      in the log with zero times
//   filtered  in the model as filtered, and not in the log
//   unlogged  in the model alone
// "unknown" behind the numbers: in the log alone.
struct BootText {
    explicit BootText(std::initializer_list<const char*> lines);

    analyze::BootTimeline Timeline() const { return analyze::MakeTimeline(log, model); }

    analyze::BootLog log;  // parallel; ends with the last plugin
    analyze::BootModel model;
};

// The place of the entry of that name in the timeline; it fails the test when there is none.
std::size_t EntryOf(const analyze::BootTimeline& timeline, const std::string& name);

}  // namespace vantor::support

#endif
