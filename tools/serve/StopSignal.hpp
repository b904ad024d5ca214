// SPDX-License-Identifier: MIT
#pragma once
// SIGINT and SIGTERM as an event that poll() can wait for: while an instance
// lives, either signal makes fd() readable and requested() true instead of
// ending the process, so that the server can release the cable and leave.
// SIGPIPE is ignored meanwhile.  One instance at a time.

namespace jexjtag::serve {

class StopSignal {
public:
    StopSignal();
    ~StopSignal();
    StopSignal(const StopSignal&) = delete;
    StopSignal& operator=(const StopSignal&) = delete;

    int fd() const;
    bool requested() const;
};

} // namespace jexjtag::serve
