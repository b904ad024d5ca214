// SPDX-License-Identifier: MIT
#include "target/Target.hpp"

#include "jexjtag/rt/IDCode.hpp"
#include "target/CallContextCopy.hpp"
#include "target/Vivedoru10TargetImpl.hpp"

namespace JexRT {

Target::Target(Session* session) { init(session); }

Target::~Target()
{
    try {
        release();
    } catch (...) {
        // Nothing may leave a destructor; what the plug-in holds is lost with the target.
    }
}

void Target::init(Session* session)
{
    m_session = session;
    m_open = false;
    ITarget* fresh = new Vivedoru10TargetImpl(session);
    delete m_impl;
    m_impl = fresh;
}

void Target::release()
{
    if (getLockStatus() == JEXJTAG_LOCKED_ME) unlock();
    if (isOpen()) close();
    m_session = nullptr;
    delete m_impl;
    m_impl = nullptr;
}

unsigned Target::open(const std::string& name, JexJtagCallContext* context, const std::vector<std::string>& args)
{
    if (!m_impl) return JEX_FAILURE;
    JexJtagCallContext copy = copyCallContext(context);
    const unsigned status = m_impl->open(name, &copy, args);
    if (!JEX_FAILED(status)) m_open = true;
    return status;
}

unsigned Target::close()
{
    const unsigned status = m_impl ? m_impl->close() : JEX_FAILURE;
    m_open = false;
    return status;
}

unsigned Target::lock(unsigned msWait) { return m_impl ? m_impl->lock(msWait) : JEX_FAILURE; }

unsigned Target::unlock() { return m_impl ? m_impl->unlock() : JEX_FAILURE; }

unsigned Target::getLockStatus() { return m_impl ? m_impl->getLockStatus() : unsigned{JEXJTAG_NOTARGET}; }

unsigned Target::getInfo(JexJtagTargetInfo* info) { return m_impl ? m_impl->getInfo(info) : JEX_FAILURE; }

unsigned Target::sendCommand(const std::string& command, const unsigned char* inbuf, unsigned inbuflen,
                             unsigned char* outbuf, unsigned* outbuflen, JexJtagCallContext* context)
{
    if (!m_impl) return JEX_FAILURE;
    JexJtagCallContext copy = copyCallContext(context);
    return m_impl->sendCommand(command, inbuf, inbuflen, outbuf, outbuflen, &copy);
}

unsigned Target::getOption(const std::string& key, std::string& value, unsigned* valuesize)
{
    return m_impl ? m_impl->getOption(key, value, valuesize) : JEX_FAILURE;
}

unsigned Target::setOption(const std::string& key, const std::string& value)
{
    return m_impl ? m_impl->setOption(key, value) : JEX_FAILURE;
}

unsigned Target::autodetect(unsigned algorithm) { return m_impl ? m_impl->autodetect(algorithm) : JEX_FAILURE; }

unsigned Target::interrogate(unsigned algorithm) { return m_impl ? m_impl->interrogate(algorithm) : JEX_FAILURE; }

unsigned Target::getDeviceCount(unsigned* count)
{
    *count = 0;
    return m_impl ? m_impl->getDeviceCount(count) : JEX_FAILURE;
}

unsigned Target::setDeviceCount(unsigned count) { return m_impl ? m_impl->setDeviceCount(count) : JEX_FAILURE; }

unsigned Target::getBypassCmd(unsigned deviceIndex, std::string& instruction)
{
    return m_impl ? m_impl->getBypassCmd(deviceIndex, instruction) : JEX_FAILURE;
}

unsigned Target::setBypassCmd(unsigned deviceIndex, const std::string& instruction)
{
    return m_impl ? m_impl->setBypassCmd(deviceIndex, instruction) : JEX_FAILURE;
}

unsigned Target::getIRLength(unsigned deviceIndex, unsigned* irlen)
{
    *irlen = 0;
    return m_impl ? m_impl->getIRLength(deviceIndex, irlen) : JEX_FAILURE;
}

unsigned Target::setIRLength(unsigned deviceIndex, unsigned irlen)
{
    return m_impl ? m_impl->setIRLength(deviceIndex, irlen) : JEX_FAILURE;
}

unsigned Target::getDeviceIdcode(unsigned deviceIndex, IDCode& idcode)
{
    idcode.setIDCode(0u);
    return m_impl ? m_impl->getDeviceIdcode(deviceIndex, idcode) : JEX_FAILURE;
}

unsigned Target::setDeviceIdcode(unsigned deviceIndex, const IDCode& idcode)
{
    return m_impl ? m_impl->setDeviceIdcode(deviceIndex, idcode) : JEX_FAILURE;
}

unsigned Target::navigate(unsigned newState, unsigned clockRepeat, unsigned microSeconds)
{
    return m_impl ? m_impl->navigate(newState, clockRepeat, microSeconds) : JEX_FAILURE;
}

unsigned Target::shiftChainIR(const unsigned char* tdibuf, unsigned char* tdobuf, unsigned bitCount,
                              const unsigned char* tdimask, const unsigned char* tdomask, unsigned shiftMode,
                              unsigned exitState, JexJtagCallContext* context)
{
    if (!m_impl) return JEX_FAILURE;
    JexJtagCallContext copy = copyCallContext(context);
    return m_impl->shiftChainIR(tdibuf, tdobuf, bitCount, tdimask, tdomask, shiftMode, exitState, &copy);
}

unsigned Target::shiftDeviceIR(unsigned deviceIndex, const unsigned char* tdibuf, unsigned char* tdobuf,
                               unsigned bitCount, const unsigned char* tdimask, const unsigned char* tdomask,
                               unsigned shiftMode, unsigned exitState, JexJtagCallContext* context)
{
    if (!m_impl) return JEX_FAILURE;
    JexJtagCallContext copy = copyCallContext(context);
    return m_impl->shiftDeviceIR(deviceIndex, tdibuf, tdobuf, bitCount, tdimask, tdomask, shiftMode, exitState,
                                 &copy);
}

unsigned Target::shiftChainDR(const unsigned char* tdibuf, unsigned char* tdobuf, unsigned bitCount,
                              const unsigned char* tdimask, const unsigned char* tdomask, unsigned shiftMode,
                              unsigned exitState, JexJtagCallContext* context)
{
    if (!m_impl) return JEX_FAILURE;
    JexJtagCallContext copy = copyCallContext(context);
    return m_impl->shiftChainDR(tdibuf, tdobuf, bitCount, tdimask, tdomask, shiftMode, exitState, &copy);
}

unsigned Target::shiftDeviceDR(unsigned deviceIndex, const unsigned char* tdibuf, unsigned char* tdobuf,
                               unsigned bitCount, const unsigned char* tdimask, const unsigned char* tdomask,
                               unsigned shiftMode, unsigned exitState, JexJtagCallContext* context)
{
    if (!m_impl) return JEX_FAILURE;
    JexJtagCallContext copy = copyCallContext(context);
    return m_impl->shiftDeviceDR(deviceIndex, tdibuf, tdobuf, bitCount, tdimask, tdomask, shiftMode, exitState,
                                 &copy);
}

unsigned Target::cleanLocks(const std::string& type) { return m_impl ? m_impl->cleanLocks(type) : JEX_FAILURE; }

unsigned Target::flush() { return m_impl ? m_impl->flush() : JEX_FAILURE; }

unsigned Target::setPin(unsigned pin, unsigned value) { return m_impl ? m_impl->setPin(pin, value) : JEX_FAILURE; }

unsigned Target::getPin(unsigned pin, unsigned* value) { return m_impl ? m_impl->getPin(pin, value) : JEX_FAILURE; }

unsigned Target::pulsePin(unsigned pin, unsigned count)
{
    return m_impl ? m_impl->pulsePin(pin, count) : JEX_FAILURE;
}

unsigned Target::waitTime(unsigned microSeconds) { return m_impl ? m_impl->waitTime(microSeconds) : JEX_FAILURE; }

} // namespace JexRT
