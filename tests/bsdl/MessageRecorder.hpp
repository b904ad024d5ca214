// SPDX-License-Identifier: MIT
#pragma once
// Records every message raised through the host layer's dispatcher while it
// lives, and keeps the default printer quiet meanwhile.

#include <string>
#include <utility>
#include <vector>

#include "hostlayer/Port_MsgDispatcher.hpp"
#include "hostlayer/Port_MsgMan.hpp"

class MessageRecorder : public Port_MsgMan {
public:
    MessageRecorder() : m_default(Port_MsgDispatcher::getDefaultMsgMan())
    {
        Port_MsgDispatcher::addMsgMan(this);
        Port_MsgDispatcher::removeMsgMan(m_default);
    }
    ~MessageRecorder() override
    {
        Port_MsgDispatcher::addMsgMan(m_default);
        Port_MsgDispatcher::removeMsgMan(this);
    }
    void outputMsg(MsgType type, const wchar_t* text) override { messages.emplace_back(type, text); }

    std::vector<std::wstring> of(MsgType type) const
    {
        std::vector<std::wstring> out;
        for (const auto& m : messages)
            if (m.first == type) out.push_back(m.second);
        return out;
    }
    bool has(MsgType type, const std::wstring& part) const
    {
        for (const auto& m : messages)
            if (m.first == type && m.second.find(part) != std::wstring::npos) return true;
        return false;
    }

    std::vector<std::pair<MsgType, std::wstring>> messages;

private:
    Port_MsgMan* m_default;
};
