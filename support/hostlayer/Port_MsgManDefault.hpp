// SPDX-License-Identifier: MIT
#pragma once
// The host layer's default message manager: prints each message on
// standard error as "<name>: <kind>: <text>".

#include <string>

#include "hostlayer/Port_MsgMan.hpp"

class Port_MsgManDefault : public Port_MsgMan {
public:
    explicit Port_MsgManDefault(const char* name);
    ~Port_MsgManDefault() override;
    void outputMsg(MsgType type, const wchar_t* text) override;

private:
    std::string m_name;
};
