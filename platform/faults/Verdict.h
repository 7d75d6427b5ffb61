// What stands between a caller and a platform interface in test builds. `make-calls` writes the
// code that asks here, one small piece for every call.
#pragma once

extern "C" {

/// What a call returns; `make-calls` reads it off the headers.
enum { PELLIKO_FAULT_NUMBER = 0, PELLIKO_FAULT_POINTER_OR_BOOL = 1 };

struct PellikoVerdict {
    long fails;  ///< 1 when the call is not to be made
    long result; ///< what its caller gets then
};

/// Whether there is anything to ask for; without a plan and a trace a call goes straight on.
extern bool pelliko_faults_asked_for;

/// Counts one call. Any thread; nothing is thrown.
PellikoVerdict pelliko_fault_verdict(const char *call, int kind);
}
