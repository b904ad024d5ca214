// SPDX-License-Identifier: MIT
#pragma once
// Vivedoru10TargetImpl - the target implementation behind a Target: it owns
// the link to one plug-in instance (m_plugin, null while closed) and
// forwards every operation to it through the instance's operation table,
// tracing each call and its result.
//
// Forwarding rule: the result starts as JEX_FAILURE; without an instance
// the operation logs "m_plugin is NULL!" at level 1 and returns it;
// otherwise the plug-in's status is the result.  Nothing is formatted for
// the log unless its level is enabled, and the shift and navigate paths
// allocate nothing.

#include <string>
#include <vector>

#include "jexjtag/plugin.h"
#include "target/ITarget.hpp"

namespace JexRT {

class Session;
struct PluginModule;

class Vivedoru10TargetImpl : public ITarget {
public:
    explicit Vivedoru10TargetImpl(Session* session);
    // Closes the instance when one is open.
    ~Vivedoru10TargetImpl() override;

    // Creates an instance of the type `name`, tells it the session handle
    // and opens it with args.  Fails, touching nothing, while an instance
    // is open.
    unsigned open(const std::string& name, JexJtagCallContext* context,
                  const std::vector<std::string>& args) override;
    // closeTarget, then the instance is given back whatever it answered.
    // The locked flag is left as it is.
    unsigned close() override;
    // Asks the plug-in only while this target does not hold the lock.
    unsigned lock(unsigned msWait) override;
    // Asks the plug-in only while this target holds the lock.
    unsigned unlock() override;
    // JEXJTAG_LOCKED_ME or JEXJTAG_UNLOCKED, from the locked flag.
    unsigned getLockStatus() override;
    // Clears the whole record first.
    unsigned getInfo(JexJtagTargetInfo* info) override;
    unsigned sendCommand(const std::string& command, const unsigned char* inbuf, unsigned inbuflen,
                         unsigned char* outbuf, unsigned* outbuflen, JexJtagCallContext* context) override;
    // The command "get" with the key; the plug-in gets a buffer of
    // *valuesize bytes and the caller's word itself.
    unsigned getOption(const std::string& key, std::string& value, unsigned* valuesize) override;
    // The command "set" with "key=value".
    unsigned setOption(const std::string& key, const std::string& value) override;
    // interrogate, then each device's IR length from the session's device
    // database (0 for a device it does not know).
    unsigned autodetect(unsigned algorithm) override;
    // The algorithm is not passed on.
    unsigned interrogate(unsigned algorithm) override;
    // A count above 2048 (no chain has more devices; plug-ins answer
    // 0xFFFFFFFF and the like for an error) fails with an error message.
    unsigned getDeviceCount(unsigned* count) override;
    unsigned setDeviceCount(unsigned count) override;
    // Appends one '1' per instruction-register bit (BYPASS is all ones).
    unsigned getBypassCmd(unsigned deviceIndex, std::string& instruction) override;
    // Not supported: always JEX_FAILURE.
    unsigned setBypassCmd(unsigned deviceIndex, const std::string& instruction) override;
    unsigned getIRLength(unsigned deviceIndex, unsigned* irlen) override;
    unsigned setIRLength(unsigned deviceIndex, unsigned irlen) override;
    unsigned getDeviceIdcode(unsigned deviceIndex, IDCode& idcode) override;
    unsigned setDeviceIdcode(unsigned deviceIndex, const IDCode& idcode) override;
    // navigateTAP; with microSeconds > 0 then flush and sleep at least
    // microSeconds whatever navigateTAP answered.
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
    // Only without an open instance: a temporary instance of `type` cleans
    // the stale locks and is given back.
    unsigned cleanLocks(const std::string& type) override;
    unsigned flush() override;
    unsigned setPin(unsigned pin, unsigned value) override;
    unsigned getPin(unsigned pin, unsigned* value) override;
    unsigned pulsePin(unsigned pin, unsigned count) override;
    unsigned waitTime(unsigned microSeconds) override;

private:
    enum class Register { ChainIR, DeviceIR, ChainDR, DeviceDR };

    unsigned shift(Register which, unsigned deviceIndex, const unsigned char* tdibuf, unsigned char* tdobuf,
                   unsigned bitCount, const unsigned char* tdimask, const unsigned char* tdomask,
                   unsigned shiftMode, unsigned exitState, JexJtagCallContext* context);
    // Logs "m_plugin is NULL!" at level 1 when there is no instance.
    bool hasPlugin() const;
    // Sends an error message to the session's host and logs it at level 1.
    void reportError(const std::string& text);

    Session* m_session;
    JexPluginInstance* m_plugin = nullptr;
    const PluginModule* m_creator = nullptr; // the module m_plugin came from
    std::string m_targetName;        // the type m_plugin was created under
    std::vector<std::string> m_args; // of the last accepted open
    bool m_locked = false;
};

} // namespace JexRT
