// SPDX-License-Identifier: MIT
#pragma once
// Session - what a session handle stands for: the host's callback and
// arguments, the session's message listener, its plug-in search path, and
// the session-level operations every other layer uses.  Only the registry
// constructs and destroys sessions.

#include <atomic>
#include <istream>
#include <memory>
#include <string>
#include <vector>

#include "jexjtag/rt/DeviceDB.hpp"
#include "jexjtag/rt/IDCode.hpp"
#include "jexjtag/types.h"

namespace JexRT {

class BoundaryStore;
class InternalSessionMessageListener;
class PluginManager;
class Target;

class Session final {
public:
    // Runs init(); if init throws, everything it set up is released and the
    // exception passes on.
    Session(unsigned handle, JexMessageCallback msgCallback, const std::vector<std::string>& args);
    ~Session();
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;

    virtual void init(unsigned handle, JexMessageCallback msgCallback, const std::vector<std::string>& args);
    // Takes the session down to an empty shell (no callback, handle 0, no
    // listener).
    virtual void release();
    // Reads the BSDL file at `path`: the entity name, the instruction
    // length, the IDCODE register text ("" when the device has none) and
    // the first BYPASS opcode, each text cut to 2047 characters.  On
    // failure the host gets an error message and outputs written before the
    // failure keep their values.  Messages name the file `shownName` (the
    // path when empty).  JEX_SUCCESS or JEX_FAILURE.
    virtual unsigned parseBSDLFromFile(const std::string& path, std::string& deviceName, unsigned* irlength,
                                       std::string& idcode, std::string& bypass, const std::string& shownName = "");
    // Reads the BSDL file at `path` whole, once and without seeking (pipes
    // and FIFOs work), at most the BSDL reader's size limit.  On failure the
    // host gets an error message naming the file.  JEX_SUCCESS or
    // JEX_FAILURE.
    virtual unsigned readBSDLFile(const std::string& path, std::string& content);
    virtual const char* getClassName() const { return "Session"; }
    virtual unsigned getHandle() const { return m_handle; }

    // The target slot (only index 0 exists).  getTarget: the target or
    // null.  createTarget: destroys the old target first, then stores and
    // returns a new one (null for another index or when it cannot be
    // made).  destroyTarget: takes the target out of the slot and deletes
    // it, which closes it; inside a call from a callback the deletion waits
    // until the outermost call returns (the target may be in use).
    virtual Target* getTarget(unsigned index) const;
    virtual Target* createTarget(unsigned index);
    virtual void destroyTarget(unsigned index);

    // Delivers a message to the host: its callback, or else standard output
    // with the type's prefix ("Error:", "Warning:", "Status:", "Info:").
    // Nothing once the host has destroyed the session.
    virtual void sendMessage(unsigned msgType, const std::string& text);

    // Stores the host's search path, then refreshes the target list.
    virtual void setPluginSearchPath(const std::string& path);
    virtual std::string getPluginSearchPath() const { return m_pluginSearchPath; }

    // The target list, as the plug-in manager keeps it.
    virtual unsigned refreshTargetList();
    virtual unsigned getTargetCount();
    virtual unsigned getTargetXMLSizeByIndex(unsigned index);
    virtual unsigned getTargetByIndex(unsigned index, char* xmlBuf, unsigned xmlBufLen, std::string* targetName,
                                      std::string* pluginName);

    // Reads a caller's IDCODE list from in into the device database, as user
    // entries.  JEX_FAILURE when anything goes wrong (a bad line: the
    // entries before it stay).
    virtual unsigned addDeviceData(const std::string& name, std::istream& in);
    // Looks idcode up in the device database: the name, and each number and
    // the user-list flag whose pointer is given; bypass becomes one '1' per
    // bit of the IR length ("" when irLength is null).  A code no entry
    // matches succeeds with "", zeros, false and bypass untouched.
    virtual unsigned idcodeLookup(const IDCode& idcode, std::string& deviceName, unsigned* irLength,
                                  unsigned* familyType, unsigned* familySubType, std::string& bypass,
                                  bool* isUserList);
    // The same for a BSDL text in memory: it is written to a temporary file
    // named after the base name of `filename` in the per-user ".lumenfold"
    // directory, read from there, and the file is removed again.  Messages
    // name `filename`.  A text larger than the reader's limit fails before
    // anything is copied.
    virtual unsigned parseBSDLFromBuffer(const std::string& filename, const char* buf, unsigned bufLen,
                                         std::string& deviceName, unsigned* irlength, std::string& idcode,
                                         std::string& bypass);

    const std::vector<std::string>& getArguments() const { return m_args; }
    // The session's BSDL parts and BSDL library (created on first use).
    BoundaryStore& boundary();

    // Set by the registry when the host destroys the session: its handle
    // reaches nothing any more and its messages are dropped, while a call
    // still under way finishes with it.
    void markClosing() { m_closing = true; }
    bool isClosing() const { return m_closing; }

    // The one plug-in manager of the process: created by the first
    // session's init, deleted by the registry after the last session
    // (unless "unloadtargetsondestroy=false").  Null while none exists.
    static PluginManager* m_pluginManager;

private:
    unsigned m_handle = 0;
    Target* m_target = nullptr; // owned; index 0
    JexMessageCallback m_msgCallback = nullptr;
    std::vector<std::string> m_args;
    std::string m_pluginSearchPath;
    std::unique_ptr<InternalSessionMessageListener> m_messageListener;
    DeviceDB m_deviceDB;
    std::atomic<bool> m_closing {false};
    std::unique_ptr<BoundaryStore> m_boundary;
};

} // namespace JexRT
