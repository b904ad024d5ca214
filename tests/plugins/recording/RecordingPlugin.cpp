// SPDX-License-Identifier: MIT
// A cable plug-in for tests.  It drives no hardware: it appends one line per
// entry point and operation, with the arguments it received in order, to the
// file named by $JEXJTAG_RECORDING_FILE, and answers as configured.
//
// Each line starts with the module name and ": ".  Configuration comes from
// $JEXJTAG_RECORDING_CONFIG ("key=value;key=value") read when an instance is
// created, then from the open arguments (the same keys, one per argument):
//
//   create=null              JexPlugin_create returns null
//   fail=op,op               these operations answer JEX_FAILURE
//   status.<op>=<number>     this operation answers <number>
//   devices=<hex>:<ir>,...   the chain: IDCODE and IR length per device
//   flags=<number>           target_flags of the information record
//   option.<key>=<text>      the answer to "get" of <key> (unknown: failure)
//   optlen=text|full|keep    what "get" leaves in *outLength: the length of
//                            the text written, the option's full length, or
//                            the capacity as it was (default text)
//   pin=<number>             what getPin answers (read shifts write 0x5A into tdo)
//   cmdout=<text>            the answer to any other command
//   say=op,op                these operations first send their name to the
//                            session as a warning (the host may call back in)
//   count=<number>           what getDeviceCount answers (default: the chain)

#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <strings.h>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "RecordingFormat.hpp"
#include "jexjtag/plugin.hpp"

#ifndef RECORDING_MODULE_NAME
#  define RECORDING_MODULE_NAME "RecordingPlugin"
#endif

namespace {

using recording::pointerText;

std::string environment(const char* name)
{
    const char* value = std::getenv(name);
    return value ? value : "";
}

struct Config {
    std::map<std::string, std::string> values;

    void add(const std::string& item)
    {
        const size_t eq = item.find('=');
        if (eq == std::string::npos || eq == 0) return;
        values[item.substr(0, eq)] = item.substr(eq + 1);
    }
    void addList(const std::string& list)
    {
        std::stringstream in(list);
        std::string item;
        while (std::getline(in, item, ';')) add(item);
    }
    std::string get(const std::string& key, const std::string& fallback = "") const
    {
        auto it = values.find(key);
        return it == values.end() ? fallback : it->second;
    }
    unsigned long number(const std::string& key, unsigned long fallback) const
    {
        auto it = values.find(key);
        return it == values.end() ? fallback : std::strtoul(it->second.c_str(), nullptr, 0);
    }
};

Config environmentConfig()
{
    Config config;
    config.addList(environment(recording::kConfigVariable));
    return config;
}

void appendLine(const char* format, ...)
{
    const std::string path = environment(recording::kRecordFileVariable);
    if (path.empty()) return;
    std::FILE* out = std::fopen(path.c_str(), "a");
    if (!out) return;
    std::fputs(RECORDING_MODULE_NAME ": ", out);
    va_list args;
    va_start(args, format);
    std::vfprintf(out, format, args);
    va_end(args);
    std::fputc('\n', out);
    std::fclose(out);
}

struct Device {
    uint32_t idcode;
    int32_t irLength;
};

class RecordingCable : public jexjtag::PluginBase {
public:
    RecordingCable() : m_config(environmentConfig()) { configure(); }

    uint32_t openTarget(uint32_t argc, const char** argv, JexJtagCallContext* ctx) override
    {
        std::string list;
        for (uint32_t i = 0; i < argc; ++i) {
            if (i) list += '|';
            list += argv[i] ? argv[i] : "null";
            if (argv[i]) m_config.add(argv[i]);
        }
        configure();
        m_type = m_config.get("type");
        record("openTarget argc=%u argv=[%s]%s", argc, list.c_str(), contextText(ctx).c_str());
        return status("openTarget");
    }
    uint32_t closeTarget() override
    {
        record("closeTarget");
        return status("closeTarget");
    }
    uint32_t interrogate() override
    {
        record("interrogate");
        return status("interrogate");
    }
    uint32_t getDeviceCount() override
    {
        record("getDeviceCount");
        return static_cast<uint32_t>(m_config.number("count", m_devices.size()));
    }
    uint32_t setDeviceCount(uint32_t count) override
    {
        record("setDeviceCount count=%u", count);
        const uint32_t result = status("setDeviceCount");
        if (!JEX_FAILED(result)) m_devices.resize(count, Device{0, 0});
        return result;
    }
    int32_t getIRLength(uint32_t deviceIndex) override
    {
        record("getIRLength deviceIndex=%u", deviceIndex);
        return deviceIndex < m_devices.size() ? m_devices[deviceIndex].irLength : -1;
    }
    uint32_t setIRLength(uint32_t deviceIndex, uint32_t irLength) override
    {
        record("setIRLength deviceIndex=%u irLength=%u", deviceIndex, irLength);
        const uint32_t result = status("setIRLength");
        if (!JEX_FAILED(result) && deviceIndex < m_devices.size())
            m_devices[deviceIndex].irLength = static_cast<int32_t>(irLength);
        return result;
    }
    uint32_t getDeviceIdcode(uint32_t deviceIndex) override
    {
        record("getDeviceIdcode deviceIndex=%u", deviceIndex);
        return deviceIndex < m_devices.size() ? m_devices[deviceIndex].idcode : 0xFFFFFFFFu;
    }
    uint32_t setDeviceID(uint32_t deviceIndex, uint32_t idcode) override
    {
        record("setDeviceID deviceIndex=%u idcode=0x%08x", deviceIndex, idcode);
        const uint32_t result = status("setDeviceID");
        if (!JEX_FAILED(result) && deviceIndex < m_devices.size()) m_devices[deviceIndex].idcode = idcode;
        return result;
    }
    uint32_t getTargetInfo(JexJtagTargetInfo* info) override
    {
        bool zeroed = true;
        if (info)
            for (size_t i = 0; i < sizeof *info; ++i)
                if (reinterpret_cast<const unsigned char*>(info)[i] != 0) zeroed = false;
        record("getTargetInfo info=%s zeroed=%d", pointerText(info).c_str(), zeroed ? 1 : 0);
        const uint32_t result = status("getTargetInfo");
        if (info && !JEX_FAILED(result)) {
            std::snprintf(info->target_name, sizeof info->target_name, "%s", m_type.c_str());
            std::snprintf(info->plugin_name, sizeof info->plugin_name, "%s", RECORDING_MODULE_NAME);
            std::snprintf(info->vendor, sizeof info->vendor, "Test Vendor");
            std::snprintf(info->target_uid, sizeof info->target_uid, "UID-42");
            info->target_flags = static_cast<uint32_t>(m_config.number("flags", 0));
        }
        return result;
    }
    uint32_t setSessionHandle(uint32_t handle) override
    {
        record("setSessionHandle handle=%u", handle);
        return PluginBase::setSessionHandle(handle);
    }
    uint32_t lockTarget(uint32_t msWait) override
    {
        record("lockTarget msWait=%u", msWait);
        return status("lockTarget");
    }
    uint32_t unlockTarget() override
    {
        record("unlockTarget");
        return status("unlockTarget");
    }
    uint32_t cleanLocks() override
    {
        record("cleanLocks sessionHandle=%u", sessionHandle());
        return status("cleanLocks");
    }
    uint32_t navigateTAP(uint32_t newState, uint32_t clockRepeat) override
    {
        record("navigateTAP newState=%u clockRepeat=%u", newState, clockRepeat);
        return status("navigateTAP");
    }

    uint32_t shiftChainIRRead(bool l, uint8_t* o, const uint8_t* om, uint32_t n, uint32_t e, JexJtagCallContext* c) override
    {
        return read("shiftChainIRRead", "", l, o, om, n, e, c);
    }
    uint32_t shiftChainIRWrite(const uint8_t* i, const uint8_t* im, uint32_t n, uint32_t e, JexJtagCallContext* c) override
    {
        return write("shiftChainIRWrite", "", i, im, n, e, c);
    }
    uint32_t shiftChainIRReadWrite(const uint8_t* i, uint8_t* o, const uint8_t* im, const uint8_t* om, uint32_t n,
                                   uint32_t e, JexJtagCallContext* c) override
    {
        return readWrite("shiftChainIRReadWrite", "", i, o, im, om, n, e, c);
    }
    uint32_t shiftChainDRRead(bool l, uint8_t* o, const uint8_t* om, uint32_t n, uint32_t e, JexJtagCallContext* c) override
    {
        return read("shiftChainDRRead", "", l, o, om, n, e, c);
    }
    uint32_t shiftChainDRWrite(const uint8_t* i, const uint8_t* im, uint32_t n, uint32_t e, JexJtagCallContext* c) override
    {
        return write("shiftChainDRWrite", "", i, im, n, e, c);
    }
    uint32_t shiftChainDRReadWrite(const uint8_t* i, uint8_t* o, const uint8_t* im, const uint8_t* om, uint32_t n,
                                   uint32_t e, JexJtagCallContext* c) override
    {
        return readWrite("shiftChainDRReadWrite", "", i, o, im, om, n, e, c);
    }
    uint32_t shiftDeviceIRRead(uint32_t d, bool l, uint8_t* o, const uint8_t* om, uint32_t n, uint32_t e,
                               JexJtagCallContext* c) override
    {
        return read("shiftDeviceIRRead", deviceText(d).c_str(), l, o, om, n, e, c);
    }
    uint32_t shiftDeviceIRWrite(uint32_t d, const uint8_t* i, const uint8_t* im, uint32_t n, uint32_t e,
                                JexJtagCallContext* c) override
    {
        return write("shiftDeviceIRWrite", deviceText(d).c_str(), i, im, n, e, c);
    }
    uint32_t shiftDeviceIRReadWrite(uint32_t d, const uint8_t* i, uint8_t* o, const uint8_t* im, const uint8_t* om,
                                    uint32_t n, uint32_t e, JexJtagCallContext* c) override
    {
        return readWrite("shiftDeviceIRReadWrite", deviceText(d).c_str(), i, o, im, om, n, e, c);
    }
    uint32_t shiftDeviceDRRead(uint32_t d, bool l, uint8_t* o, const uint8_t* om, uint32_t n, uint32_t e,
                               JexJtagCallContext* c) override
    {
        return read("shiftDeviceDRRead", deviceText(d).c_str(), l, o, om, n, e, c);
    }
    uint32_t shiftDeviceDRWrite(uint32_t d, const uint8_t* i, const uint8_t* im, uint32_t n, uint32_t e,
                                JexJtagCallContext* c) override
    {
        return write("shiftDeviceDRWrite", deviceText(d).c_str(), i, im, n, e, c);
    }
    uint32_t shiftDeviceDRReadWrite(uint32_t d, const uint8_t* i, uint8_t* o, const uint8_t* im, const uint8_t* om,
                                    uint32_t n, uint32_t e, JexJtagCallContext* c) override
    {
        return readWrite("shiftDeviceDRReadWrite", deviceText(d).c_str(), i, o, im, om, n, e, c);
    }

    uint32_t flush() override
    {
        record("flush");
        return status("flush");
    }
    uint32_t setPin(uint32_t pin, uint32_t value) override
    {
        record("setPin pin=%u value=%u", pin, value);
        return status("setPin");
    }
    uint32_t getPin(uint32_t pin, uint32_t* value) override
    {
        record("getPin pin=%u value=%s", pin, pointerText(value).c_str());
        const uint32_t result = status("getPin");
        if (value && !JEX_FAILED(result)) *value = static_cast<uint32_t>(m_config.number("pin", 0));
        return result;
    }
    uint32_t pulsePin(uint32_t pin, uint32_t count) override
    {
        record("pulsePin pin=%u count=%u", pin, count);
        return status("pulsePin");
    }
    uint32_t waitTime(uint32_t microseconds) override
    {
        record("waitTime us=%u", microseconds);
        return status("waitTime");
    }
    uint32_t sendCommand(const char* command, const uint8_t* in, uint32_t inLength, uint8_t* out, uint32_t* outLength,
                         JexJtagCallContext* ctx) override
    {
        const std::string inText =
            in ? std::string(reinterpret_cast<const char*>(in), strnlen(reinterpret_cast<const char*>(in), inLength))
               : std::string("null");
        const std::string outLengthText = outLength ? std::to_string(*outLength) : std::string("null");
        record("sendCommand command=%s in=%s inLength=%u out=%s outLength=%s%s", command ? command : "null",
               inText.c_str(), inLength, pointerText(out).c_str(), outLengthText.c_str(), contextText(ctx).c_str());
        uint32_t result = status("sendCommand");
        if (JEX_FAILED(result) || !command) return result;

        if (strcasecmp(command, "set") == 0) {
            const size_t eq = inText.find('=');
            if (eq == std::string::npos) return JEX_FAILURE;
            m_config.values["option." + inText.substr(0, eq)] = inText.substr(eq + 1);
            return result;
        }
        std::string answer;
        if (strcasecmp(command, "get") == 0) {
            auto it = m_config.values.find("option." + inText);
            if (it == m_config.values.end()) return JEX_FAILURE;
            answer = it->second;
        } else {
            answer = m_config.get("cmdout");
        }
        const uint32_t capacity = outLength ? *outLength : 0;
        uint32_t written = 0;
        if (out && capacity > 0) {
            written = static_cast<uint32_t>(std::min<size_t>(answer.size(), capacity - 1));
            std::memcpy(out, answer.data(), written);
            out[written] = 0;
        }
        if (outLength) {
            const std::string mode = m_config.get("optlen", "text");
            if (mode == "text") *outLength = written;
            else if (mode == "full") *outLength = static_cast<uint32_t>(answer.size());
        }
        return result;
    }

private:
    template <typename... Args>
    void record(const char* format, Args... args)
    {
        appendLine(format, args...);
        say(std::string(format, std::strcspn(format, " ")));
    }
    // The shifts name their operation in the first argument.
    template <typename... Args>
    void record(const char* format, const char* op, Args... args)
    {
        appendLine(format, op, args...);
        say(op);
    }
    void say(const std::string& op)
    {
        std::stringstream say(m_config.get("say"));
        std::string item;
        while (std::getline(say, item, ','))
            if (item == op) jexjtag::PluginHost::sendMessage(sessionHandle(), JEX_MSG_WARNING, op.c_str());
    }

    void configure()
    {
        m_fail.clear();
        std::stringstream failing(m_config.get("fail"));
        std::string op;
        while (std::getline(failing, op, ',')) m_fail.push_back(op);
        const std::string devices = m_config.get("devices");
        if (!devices.empty()) {
            m_devices.clear();
            std::stringstream in(devices);
            std::string item;
            while (std::getline(in, item, ',')) {
                const size_t colon = item.find(':');
                Device d{static_cast<uint32_t>(std::strtoul(item.c_str(), nullptr, 16)), 0};
                if (colon != std::string::npos) d.irLength = std::atoi(item.c_str() + colon + 1);
                m_devices.push_back(d);
            }
        }
    }

    uint32_t status(const std::string& op) const
    {
        for (const std::string& f : m_fail)
            if (f == op) return JEX_FAILURE;
        return static_cast<uint32_t>(m_config.number("status." + op, JEX_SUCCESS));
    }

    static std::string contextText(const JexJtagCallContext* ctx)
    {
        if (!ctx) return " context=null";
        return " handle=" + std::to_string(ctx->handle) + " callerData=" + pointerText(ctx->callerData);
    }
    static std::string deviceText(uint32_t d) { return "deviceIndex=" + std::to_string(d) + " "; }

    static void fillTdo(uint8_t* tdo, uint32_t bitCount)
    {
        if (tdo) std::memset(tdo, 0x5A, (bitCount + 7u) / 8u);
    }

    uint32_t read(const char* op, const char* device, bool level, uint8_t* tdo, const uint8_t* tdoMask,
                  uint32_t bitCount, uint32_t exitState, JexJtagCallContext* ctx)
    {
        record("%s %stdiLevel=%d tdo=%s tdoMask=%s bitCount=%u exitState=%u%s", op, device, level ? 1 : 0,
               pointerText(tdo).c_str(), pointerText(tdoMask).c_str(), bitCount, exitState, contextText(ctx).c_str());
        fillTdo(tdo, bitCount);
        return status(op);
    }
    uint32_t write(const char* op, const char* device, const uint8_t* tdi, const uint8_t* tdiMask, uint32_t bitCount,
                   uint32_t exitState, JexJtagCallContext* ctx)
    {
        record("%s %stdi=%s tdiMask=%s bitCount=%u exitState=%u%s", op, device, pointerText(tdi).c_str(),
               pointerText(tdiMask).c_str(), bitCount, exitState, contextText(ctx).c_str());
        return status(op);
    }
    uint32_t readWrite(const char* op, const char* device, const uint8_t* tdi, uint8_t* tdo, const uint8_t* tdiMask,
                       const uint8_t* tdoMask, uint32_t bitCount, uint32_t exitState, JexJtagCallContext* ctx)
    {
        record("%s %stdi=%s tdo=%s tdiMask=%s tdoMask=%s bitCount=%u exitState=%u%s", op, device,
               pointerText(tdi).c_str(), pointerText(tdo).c_str(), pointerText(tdiMask).c_str(),
               pointerText(tdoMask).c_str(), bitCount, exitState, contextText(ctx).c_str());
        fillTdo(tdo, bitCount);
        return status(op);
    }

    Config m_config;
    std::vector<std::string> m_fail;
    std::vector<Device> m_devices;
    std::string m_type;
};

} // namespace

extern "C" JEXJTAG_PLUGIN_EXPORT JexPluginInstance* JexPlugin_create(void)
{
    appendLine("JexPlugin_create");
    if (environmentConfig().get("create") == "null") return nullptr;
    try {
        return static_cast<JexPluginInstance*>(new RecordingCable());
    } catch (...) {
        return nullptr;
    }
}

extern "C" JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_destroy(JexPluginInstance* instance)
{
    appendLine("JexPlugin_destroy instance=%s", pointerText(instance).c_str());
    delete jexjtag::PluginBase::from(instance);
    return JEX_SUCCESS;
}

extern "C" JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_loaded(void)
{
    appendLine("JexPlugin_loaded");
    return JEX_SUCCESS;
}

extern "C" JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_unloaded(void)
{
    appendLine("JexPlugin_unloaded");
    jexjtag::PluginHost::set(nullptr);
    return JEX_SUCCESS;
}

extern "C" JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_setCallbacks(const JexPluginCallbacks* callbacks)
{
    appendLine("JexPlugin_setCallbacks");
    jexjtag::PluginHost::set(callbacks);
    return JEX_SUCCESS;
}
