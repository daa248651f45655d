// SPDX-License-Identifier: Apache-2.0
//
// The process while it works: how long it has been at it, on a terminal, and what SIGINT, SIGTERM and SIGHUP make of
// it.
//
// The line is drawn by a timer's signal on the thread that works, so that a command which is done within half a second
// pays for a timer set and cleared, and no command for a thread. System calls that can be resumed are (SA_RESTART); the
// platform's libraries go on after the others. The handlers allocate nothing and take no lock.
#pragma once

#include "Activity.h"

namespace Tovicli {

class ProcessActivity : public Activity {
public:
    /// Takes over the three signals, but for those that the process was told to ignore. One object a process.
    /// @param terminal standard error may show that work goes on: it is a terminal that can move its cursor
    /// @param outputTerminal standard output is a terminal too
    ProcessActivity(bool terminal, bool outputTerminal);
    ~ProcessActivity() override;
    ProcessActivity(ProcessActivity const &) = delete;
    ProcessActivity &operator=(ProcessActivity const &) = delete;

    void begin(Work const &work) override;
    void end() override;

private:
    bool const terminal_;
    bool const outputTerminal_;
};

} // namespace Tovicli
