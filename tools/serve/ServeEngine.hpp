// SPDX-License-Identifier: MIT
#pragma once
// The remote_bitbang server side of `jexjtag serve`: turns a client's stream
// of TCK/TMS/TDI levels into TAP navigation and register shifts on an open
// target, through the library's C API, and answers its TDO reads.
//
// Work is queued, not done per bit.  Rising TCK edges are followed on a TAP
// state machine of our own: clocks in Shift-IR/Shift-DR become bits of one
// shift call (the bit that leaves the Shift state with TMS high is its last
// bit, and the call exits to Exit1), clocks elsewhere become navigation calls
// (a client path that is the one shortest path between two states is one
// call, clocks that hold a stable state are its repeat count).  Queued work
// runs when settle() is called, which the server does whenever the client has
// sent everything it had to send, so that the client gets its replies, and
// when the queue grows large.
//
// An 'R' is answered with the TDO level the TAP shows at that moment: with
// TCK low in a Shift state, the bit the next rising edge shifts out; with TCK
// high, the bit the last rising edge shifted out; '1' (TDO not driven) in any
// other case.  When a read of the next bit must be answered before its rising
// edge has arrived, that bit is shifted with the levels the client drives at
// the read, and the client's rising edge that follows is taken as done
// (clients keep TMS and TDI while they read).
//
// Requests understood: '0'..'7' levels, 'R' read, 'r'..'u' reset lines (TRST
// resets the TAPs with TMS, the library has no reset line; SRST is reported
// and ignored), 'B'/'b' (ignored), 'Z'/'z' sleeps (1 ms / 1 us on the target),
// 'Q' quit.  Anything else fails the connection.

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace jexjtag::serve {

class ServeEngine {
public:
    // handle: a session whose target is open (and locked).  notice receives
    // one-time remarks about the client ("SRST requests are ignored ...").
    explicit ServeEngine(unsigned handle, std::function<void(const std::string&)> notice = {});

    // Five TMS-high clocks: the TAPs and the followed state are in
    // Test-Logic-Reset.  Throws std::runtime_error when the target fails.
    void resetTap();

    // Takes the next client requests in order.  Returns false after 'Q' (the
    // rest of data is ignored).  Throws std::runtime_error for an unknown
    // request or a target call that fails.
    bool feed(const char* data, std::size_t size);
    // True when so much work is queued that it should run before more input.
    bool wantsSettle() const;
    // Runs the queued work on the target and appends every owed reply, in
    // request order, to replies().  Throws std::runtime_error when a target
    // call fails; the queue is dropped then and resetTap() is needed.
    void settle();
    std::string& replies() { return m_replies; }

    // The client has gone: runs what it clocked, forgets owed replies and
    // pin levels.  Returns false when that failed (resetTap() is needed).
    bool endClient();

private:
    // A queued operation: a navigation or a shift call.
    struct Op {
        bool shift = false;
        unsigned from = 0;   // navigation: starting state
        unsigned to = 0;     // navigation: destination; shift: exit state once closed
        unsigned length = 0; // navigation: clocks of the path
        uint32_t repeat = 0; // navigation: clocks held in `to`
        bool ir = false;     // shift: instruction register
        bool open = true;    // shift: more bits may come (runs with the Shift state as exit)
        bool read = false;   // shift: some reply needs its TDO
        uint32_t bits = 0;
        std::vector<uint8_t> tdi, tdo;
    };
    // A reply: TDO bit `bit` of op `op`, or the fixed level `bit` when op < 0.
    struct Reply {
        int32_t op;
        uint32_t bit;
    };

    void write(unsigned levels);
    void read();
    void rising(bool tms, bool tdi);
    void sleepNow();
    void resetLines(unsigned lines);
    Op& openShift();
    void run();

    unsigned m_handle;
    std::function<void(const std::string&)> m_notice;
    unsigned m_state = 0; // the client's TAP state after every clock seen
    bool m_tck = false, m_tms = false, m_tdi = false;
    // A bit shifted ahead of its rising edge (see above) and its levels.
    bool m_ahead = false, m_aheadTms = false, m_aheadTdi = false;
    // TDO while TCK is high: bit m_lastBit of op m_lastOp, or m_lastLevel.
    int32_t m_lastOp = -1;
    uint32_t m_lastBit = 0;
    bool m_lastLevel = true;
    uint64_t m_queuedBits = 0;
    uint64_t m_sleepUs = 0;
    bool m_warnedSrst = false, m_warnedLevels = false;
    std::vector<Op> m_ops;
    std::vector<Reply> m_owed;
    std::string m_replies;
};

} // namespace jexjtag::serve
