// SPDX-License-Identifier: MIT
#pragma once
// The host layer's dispatcher: a set of message managers, one of them the
// default.  Every message raised in the host layer goes to every manager in
// the set, in the order they were added.

#include "hostlayer/Port_MsgMan.hpp"

class Port_MsgDispatcher {
public:
    // The current default manager (the built-in printer until replaced).
    static Port_MsgMan* getDefaultMsgMan();
    // Adds a manager to the set; false when null or already there.
    static bool addMsgMan(Port_MsgMan* manager);
    // Takes a manager out of the set; false when it is not there.  Removing
    // the default manager leaves the dispatcher without a default until a
    // manager is added again (the first one added becomes the default).
    static bool removeMsgMan(Port_MsgMan* manager);
    // Raises a message: every manager of the set receives it.
    static void dispatch(Port_MsgMan::MsgType type, const wchar_t* text);
    // Raises a printf-style (wide) message.
    static void post(Port_MsgMan::MsgType type, const wchar_t* format, ...);
};

// Static initialiser of the host layer's message management: sets up the
// built-in default manager when the library is loaded.
class Port_MsgManInit {
public:
    Port_MsgManInit();
    ~Port_MsgManInit();
};
