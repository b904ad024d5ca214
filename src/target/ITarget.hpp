// SPDX-License-Identifier: MIT
#pragma once
// ITarget - every operation a host can ask of a target, in slot order.
//
// Statuses are 32-bit, a failure when bit 31 is set.  Call contexts are
// passed by pointer; each layer hands the next a pointer to its own copy.
// TAP states, shift modes, pins and lock statuses are the enumerations of
// jexjtag/types.h, carried as plain unsigned values: nothing here checks
// them, every value goes on to the plug-in.

#include <string>
#include <vector>

#include "jexjtag/types.h"

namespace JexRT {

class IDCode;

class ITarget {
public:
    virtual ~ITarget() = default;                                                                  // 0

    virtual unsigned open(const std::string& name, JexJtagCallContext* context,
                          const std::vector<std::string>& args) = 0;                               // 1
    virtual unsigned close() = 0;                                                                  // 2
    virtual unsigned lock(unsigned msWait) = 0;                                                    // 3
    virtual unsigned unlock() = 0;                                                                 // 4
    // A JexJtagLockStatus, not a status.
    virtual unsigned getLockStatus() = 0;                                                          // 5
    virtual unsigned getInfo(JexJtagTargetInfo* info) = 0;                                         // 6
    virtual unsigned sendCommand(const std::string& command, const unsigned char* inbuf, unsigned inbuflen,
                                 unsigned char* outbuf, unsigned* outbuflen,
                                 JexJtagCallContext* context) = 0;                                 // 7
    // *valuesize: capacity on entry; the plug-in may change the word.
    virtual unsigned getOption(const std::string& key, std::string& value, unsigned* valuesize) = 0; // 8
    virtual unsigned setOption(const std::string& key, const std::string& value) = 0;             // 9
    virtual unsigned autodetect(unsigned algorithm) = 0;                                           // 10
    virtual unsigned interrogate(unsigned algorithm) = 0;                                          // 11
    virtual unsigned getDeviceCount(unsigned* count) = 0;                                          // 12
    virtual unsigned setDeviceCount(unsigned count) = 0;                                           // 13
    virtual unsigned getBypassCmd(unsigned deviceIndex, std::string& instruction) = 0;             // 14
    virtual unsigned setBypassCmd(unsigned deviceIndex, const std::string& instruction) = 0;       // 15
    virtual unsigned getIRLength(unsigned deviceIndex, unsigned* irlen) = 0;                       // 16
    virtual unsigned setIRLength(unsigned deviceIndex, unsigned irlen) = 0;                        // 17
    virtual unsigned getDeviceIdcode(unsigned deviceIndex, IDCode& idcode) = 0;                    // 18
    virtual unsigned setDeviceIdcode(unsigned deviceIndex, const IDCode& idcode) = 0;              // 19
    virtual unsigned navigate(unsigned newState, unsigned clockRepeat, unsigned microSeconds) = 0; // 20
    virtual unsigned shiftChainIR(const unsigned char* tdibuf, unsigned char* tdobuf, unsigned bitCount,
                                  const unsigned char* tdimask, const unsigned char* tdomask, unsigned shiftMode,
                                  unsigned exitState, JexJtagCallContext* context) = 0;            // 21
    virtual unsigned shiftDeviceIR(unsigned deviceIndex, const unsigned char* tdibuf, unsigned char* tdobuf,
                                   unsigned bitCount, const unsigned char* tdimask, const unsigned char* tdomask,
                                   unsigned shiftMode, unsigned exitState, JexJtagCallContext* context) = 0; // 22
    virtual unsigned shiftChainDR(const unsigned char* tdibuf, unsigned char* tdobuf, unsigned bitCount,
                                  const unsigned char* tdimask, const unsigned char* tdomask, unsigned shiftMode,
                                  unsigned exitState, JexJtagCallContext* context) = 0;            // 23
    virtual unsigned shiftDeviceDR(unsigned deviceIndex, const unsigned char* tdibuf, unsigned char* tdobuf,
                                   unsigned bitCount, const unsigned char* tdimask, const unsigned char* tdomask,
                                   unsigned shiftMode, unsigned exitState, JexJtagCallContext* context) = 0; // 24
    virtual unsigned cleanLocks(const std::string& type) = 0;                                      // 25
    virtual unsigned flush() = 0;                                                                  // 26
    virtual unsigned setPin(unsigned pin, unsigned value) = 0;                                     // 27
    virtual unsigned getPin(unsigned pin, unsigned* value) = 0;                                    // 28
    virtual unsigned pulsePin(unsigned pin, unsigned count) = 0;                                   // 29
    virtual unsigned waitTime(unsigned microSeconds) = 0;                                          // 30

protected:
    ITarget() = default;
    ITarget(const ITarget&) = delete;
    ITarget& operator=(const ITarget&) = delete;
};

} // namespace JexRT
