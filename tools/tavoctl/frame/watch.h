// The same question again and again, as `--watch` asks it.
#ifndef TAVOCTL_WATCH_H
#define TAVOCTL_WATCH_H

#include "frame/verb.h"

namespace tavoctl {

inline constexpr char watch_help[] = "again and again, until interrupted; in a pipe whenever something has changed";

// Prints what is looked at until a signal asks to end: at a terminal in the place of what stood there.
void Watch(const Call &call, int pause_seconds, const std::function<Table()> &look);

}  // namespace tavoctl

#endif
