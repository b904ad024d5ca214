// SPDX-License-Identifier: MIT
#pragma once
// A VCD file read back token by token, for the waveform tests of the
// simulated cable (tests/sim and tests/e2e).

#include <gtest/gtest.h>

#include <cstdint>
#include <fstream>
#include <map>
#include <string>
#include <utility>
#include <vector>

namespace vcdtest {

struct Vcd {
    std::map<std::string, std::string> names; // identifier -> signal name
    std::map<std::string, int> widths;        // identifier -> width
    std::vector<uint64_t> times;
    // signal name -> (time, value) changes after #0
    std::map<std::string, std::vector<std::pair<uint64_t, std::string>>> changes;
    std::map<std::string, std::string> initial; // from $dumpvars
    std::string timescale;
    bool definitionsEnded = false;
};

// Every value change must name a declared signal, and a vector one must have
// its declared width.
inline Vcd parse(const std::string& path)
{
    Vcd vcd;
    std::ifstream in(path);
    std::string token;
    uint64_t now = 0;
    bool inDumpvars = false;
    auto record = [&](const std::string& id, const std::string& value) {
        EXPECT_TRUE(vcd.names.count(id)) << id;
        if (inDumpvars) vcd.initial[vcd.names[id]] = value;
        else vcd.changes[vcd.names[id]].emplace_back(now, value);
    };
    while (in >> token) {
        if (token == "$var") {
            std::string type, width, id, name, end;
            in >> type >> width >> id >> name >> end;
            EXPECT_EQ(end, "$end");
            vcd.names[id] = name;
            vcd.widths[id] = std::stoi(width);
        } else if (token == "$timescale") {
            in >> vcd.timescale;
        } else if (token == "$enddefinitions") {
            vcd.definitionsEnded = true;
        } else if (token == "$dumpvars") {
            inDumpvars = true;
        } else if (token == "$end") {
            inDumpvars = false;
        } else if (token[0] == '#') {
            now = std::stoull(token.substr(1));
            vcd.times.push_back(now);
        } else if (vcd.definitionsEnded && (token[0] == '0' || token[0] == '1')) {
            record(token.substr(1), token.substr(0, 1));
        } else if (vcd.definitionsEnded && (token[0] == 's' || token[0] == 'b')) {
            std::string id;
            in >> id;
            if (token[0] == 'b') {
                EXPECT_EQ(static_cast<int>(token.size()) - 1, vcd.widths[id]) << token;
            }
            record(id, token.substr(1));
        } else if (vcd.definitionsEnded) {
            ADD_FAILURE() << "unexpected token: " << token;
        }
    }
    return vcd;
}

} // namespace vcdtest
