// SPDX-License-Identifier: MIT
#pragma once
// remote_bitbang requests on a socket as the wire of a cable.
//
// Each clock is two level writes, TCK low with the new TMS/TDI ('0'..'3')
// and TCK high ('4'..'7'), so TCK rests high; a read puts 'R' between them,
// where the TAP shows the TDO of the bit about to be shifted.  Write-only
// shifts and TMS moves send no 'R'.  Requests are queued in one buffer and
// sent in large writes; replies are read in bulk while sending (so a server
// that answers before it reads on never blocks us) and written into the
// shifts' sinks in order.  At most kMaxUnanswered reads are outstanding:
// at that mark replies are taken until half of them have come.
//
// Only '0'..'7', 'R', 'Q' and 'r'..'u' are sent, unless remote sleeps are
// turned on ('Z' for 1 ms, 'z' for 1 us; understood by newer servers only).
//
// Any failure (the server gone, a reply other than '0'/'1', no reply within
// the timeout) throws std::runtime_error and closes the connection: replies
// could no longer be matched to reads.  Every later call throws too.

#include <cstdint>
#include <string>
#include <vector>

#include "jexjtag/cable/JtagTransport.hpp"
#include "RbbSocket.hpp"

namespace jexrbb {

class RbbTransport : public jexcable::JtagTransport {
public:
    static constexpr uint64_t kMaxUnanswered = 1u << 16;

    RbbTransport() = default;
    ~RbbTransport() override;

    // Takes over a connected socket (any earlier one is closed first).
    void attach(RbbSocket socket);
    // Sends 'Q' (best effort) and closes the connection.
    void detach();
    bool isConnected() const { return m_socket.isOpen(); }

    void setTimeoutMs(unsigned ms) { m_timeoutMs = ms; }
    unsigned timeoutMs() const { return m_timeoutMs; }
    void setRemoteSleep(bool on) { m_remoteSleep = on; }
    bool remoteSleep() const { return m_remoteSleep; }

    void moveTms(const uint8_t* tms, uint32_t count, bool tdi) override;
    void shift(const jexcable::ShiftSource& in, const jexcable::ShiftSink& out, uint32_t count,
               bool tmsOnLast) override;
    void idleClocks(uint64_t count, bool tms, bool tdi) override;
    void flush() override;
    bool readPin(uint32_t pin, bool& level) override;
    bool hasResetLines() const override { return true; }
    void setResetLines(bool trst, bool srst) override;
    void sleep(uint32_t microseconds) override;

private:
    // Reads whose replies go to consecutive bits of a sink.
    struct ReadRun {
        jexcable::ShiftSink sink;
        uint64_t offset;
        uint64_t count;
    };

    void requireConnection();
    void clockBit(bool tms, bool tdi, bool read);
    void addReads(const jexcable::ShiftSink& sink, uint64_t offset, uint64_t count);
    void makeRoom();
    // Sends the queue while taking replies, then goes on taking replies
    // until at most maxUnanswered reads are outstanding.
    void pump(uint64_t maxUnanswered);
    void takeReplies(const char* data, std::size_t size);
    [[noreturn]] void broken(const std::string& text);

    RbbSocket m_socket;
    std::string m_peer;
    unsigned m_timeoutMs = 5000;
    bool m_remoteSleep = false;
    std::string m_out;
    std::vector<ReadRun> m_reads;
    std::size_t m_readIndex = 0;   // first run not complete
    uint64_t m_readDone = 0;       // replies taken into m_reads[m_readIndex]
    uint64_t m_unanswered = 0;
    uint8_t m_pinBits = 0;
    std::vector<char> m_in; // receive buffer
};

} // namespace jexrbb
