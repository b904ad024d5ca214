// SPDX-License-Identifier: MIT
#pragma once
// Target - the object a session keeps in its target slot.  It guards its
// implementation (a Vivedoru10TargetImpl): without one every operation
// fails with JEX_FAILURE and the lock status is JEXJTAG_NOTARGET.  It
// remembers whether the target is open, and on destruction it releases a
// lock this process holds and closes the target.

#include "target/ITarget.hpp"

namespace JexRT {

class Session;

class Target : public ITarget {
public:
    explicit Target(Session* session);
    ~Target() override;

    unsigned open(const std::string& name, JexJtagCallContext* context,
                  const std::vector<std::string>& args) override;
    unsigned close() override;
    unsigned lock(unsigned msWait) override;
    unsigned unlock() override;
    unsigned getLockStatus() override;
    unsigned getInfo(JexJtagTargetInfo* info) override;
    unsigned sendCommand(const std::string& command, const unsigned char* inbuf, unsigned inbuflen,
                         unsigned char* outbuf, unsigned* outbuflen, JexJtagCallContext* context) override;
    unsigned getOption(const std::string& key, std::string& value, unsigned* valuesize) override;
    unsigned setOption(const std::string& key, const std::string& value) override;
    unsigned autodetect(unsigned algorithm) override;
    unsigned interrogate(unsigned algorithm) override;
    // *count is set to 0 first.
    unsigned getDeviceCount(unsigned* count) override;
    unsigned setDeviceCount(unsigned count) override;
    unsigned getBypassCmd(unsigned deviceIndex, std::string& instruction) override;
    unsigned setBypassCmd(unsigned deviceIndex, const std::string& instruction) override;
    // *irlen is set to 0 first.
    unsigned getIRLength(unsigned deviceIndex, unsigned* irlen) override;
    unsigned setIRLength(unsigned deviceIndex, unsigned irlen) override;
    // idcode is set to 0 first.
    unsigned getDeviceIdcode(unsigned deviceIndex, IDCode& idcode) override;
    unsigned setDeviceIdcode(unsigned deviceIndex, const IDCode& idcode) override;
    unsigned navigate(unsigned newState, unsigned clockRepeat, unsigned microSeconds) override;
    unsigned shiftChainIR(const unsigned char* tdibuf, unsigned char* tdobuf, unsigned bitCount,
                          const unsigned char* tdimask, const unsigned char* tdomask, unsigned shiftMode,
                          unsigned exitState, JexJtagCallContext* context) override;
    unsigned shiftDeviceIR(unsigned deviceIndex, const unsigned char* tdibuf, unsigned char* tdobuf,
                           unsigned bitCount, const unsigned char* tdimask, const unsigned char* tdomask,
                           unsigned shiftMode, unsigned exitState, JexJtagCallContext* context) override;
    unsigned shiftChainDR(const unsigned char* tdibuf, unsigned char* tdobuf, unsigned bitCount,
                          const unsigned char* tdimask, const unsigned char* tdomask, unsigned shiftMode,
                          unsigned exitState, JexJtagCallContext* context) override;
    unsigned shiftDeviceDR(unsigned deviceIndex, const unsigned char* tdibuf, unsigned char* tdobuf,
                           unsigned bitCount, const unsigned char* tdimask, const unsigned char* tdomask,
                           unsigned shiftMode, unsigned exitState, JexJtagCallContext* context) override;
    unsigned cleanLocks(const std::string& type) override;
    unsigned flush() override;
    unsigned setPin(unsigned pin, unsigned value) override;
    unsigned getPin(unsigned pin, unsigned* value) override;
    unsigned pulsePin(unsigned pin, unsigned count) override;
    unsigned waitTime(unsigned microSeconds) override;

    // Stores the session, clears the open flag and creates a fresh
    // implementation for that session.
    virtual void init(Session* session);
    // Unlocks when this process holds the lock, closes when open, forgets
    // the session and deletes the implementation.
    virtual void release();
    virtual const char* getClassName() const { return "Target"; }
    virtual Session* getSession() const { return m_session; }
    virtual bool isOpen() const { return m_open; }

private:
    Session* m_session = nullptr;
    ITarget* m_impl = nullptr; // owned
    bool m_open = false;
};

} // namespace JexRT
