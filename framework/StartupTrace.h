// Timestamps of the steps a start-up goes through, for finding where the time goes. Off unless
// the environment variable MAPORA_STARTUP_TRACE names a file; then every step appends one line
// "<QueryPerformanceCounter in microseconds><TAB><step>" to it. tools/bench.sh reads these files.
//
// Off, a call costs one test of a flag that the first call sets: no file is opened and nothing is
// formatted, so the calls stay in the shipped program.
#pragma once

namespace fw {

// Marks the start of a step; the step lasts until the next mark. step is a literal.
void TraceStartup(const char* step);

}  // namespace fw
