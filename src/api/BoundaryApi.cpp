// SPDX-License-Identifier: MIT
// Exported boundary-scan functions: BSDL parts read in full, the BSDL
// library indexed by IDCODE, and pin access (SAMPLE, EXTEST, HIGHZ, CLAMP).

#include <cstring>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "api/ApiGuard.hpp"
#include "boundary/BoundaryStore.hpp"
#include "boundary/PinAccess.hpp"
#include "hostlayer/PortException.hpp"
#include "jexjtag/bsdl.h"
#include "jexjtag/rt/IDCode.hpp"
#include "session/Session.hpp"
#include "session/SessionRegistry.hpp"
#include "target/Target.hpp"
#include "util/Jex_Util.hpp"
#include "util/Logger.hpp"
#include "util/MethodLogger.hpp"

using namespace JexRT;

namespace {

using Register = jexbsdl::BsdlBoundaryRegister;

const char* shown(const char* text) { return text ? text : "NULL"; }

// Copies text into a given buffer, NUL-terminated, cut to size - 1.
void copyCut(char* buf, unsigned size, const std::string& text)
{
    if (!buf || size == 0) return;
    const size_t n = text.size() < size - 1 ? text.size() : size - 1;
    std::memcpy(buf, text.data(), n);
    std::memset(buf + n, 0, size - n);
}

template <size_t N>
void copyField(char (&field)[N], const std::string& text)
{
    copyCut(field, N, text);
}

const BsdlPart* findPart(unsigned handle, unsigned part)
{
    Session* session = findSession(handle);
    return session ? session->boundary().find(part) : nullptr;
}

std::string joined(const std::vector<std::string>& texts)
{
    std::string out;
    for (const std::string& t : texts) out += (out.empty() ? "" : ",") + t;
    return out;
}

// Reads a part and keeps it in the session; reader errors go to the host.
unsigned openPart(unsigned handle, const char* function, unsigned* part,
                  const std::function<std::unique_ptr<BsdlPart>()>& read)
{
    return guardedCall(function, [&]() -> unsigned {
        Session* session = findSession(handle);
        if (!session || !part) return JEX_FAILURE;
        std::unique_ptr<BsdlPart> loaded;
        try {
            loaded = read();
        } catch (const Port::Exception& e) {
            session->sendMessage(JEX_MSG_ERROR, getLocalizedPortMsg(e.getMessage()));
            return JEX_FAILURE;
        }
        if (!loaded) return JEX_FAILURE; // the reader has told why
        *part = session->boundary().add(std::move(loaded));
        Logger::logger.printLog(3, "%s() returning part=%u\n", function, *part);
        return JEX_SUCCESS;
    });
}

// Runs a pin-access step on an open target; its failure reason goes to the host.
template <typename Step>
unsigned withPins(unsigned handle, unsigned deviceIndex, unsigned part, Step&& step)
{
    Session* session = findSession(handle);
    Target* target = findTarget(handle);
    const BsdlPart* bsdl = findPart(handle, part);
    if (!session || !target || !bsdl) return JEX_FAILURE;
    PinAccess access(*target, handle, deviceIndex, *bsdl, session->boundary().held());
    const std::string error = step(access, *bsdl);
    if (error.empty()) return JEX_SUCCESS;
    session->sendMessage(JEX_MSG_ERROR, error + "\n");
    return JEX_FAILURE;
}

void copyLevels(const std::vector<int8_t>& levels, signed char* out)
{
    for (size_t i = 0; i < levels.size(); ++i) out[i] = levels[i];
}

} // namespace

extern "C" {

JEXJTAG_API const char* JexJtag_bsdl_functionName(uint32_t function)
{
    if (function > JEXJTAG_BSDL_OBSERVE_ONLY) return "";
    return Register::functionName(static_cast<Register::Function>(function));
}

JEXJTAG_API uint32_t JexJtag_bsdl_open(unsigned handle, const char* path, unsigned* part)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_open");
    Logger::logger.printLog(3, "JexJtag_bsdl_open() handle=%u, path=%s\n", handle, shown(path));
    if (part) *part = 0;
    if (!path) return tracer.setReturnStatus(JEX_FAILURE);
    const std::string trimmed = Jex_Util::trimWhitespace(path);
    return tracer.setReturnStatus(
        openPart(handle, "JexJtag_bsdl_open", part, [&] { return BsdlPart::fromFile(trimmed); }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_openBuffer(unsigned handle, const char* name, const char* buf, unsigned bufLen,
                                             unsigned* part)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_openBuffer");
    Logger::logger.printLog(3, "JexJtag_bsdl_openBuffer() handle=%u, name=%s, bufLen=%u\n", handle, shown(name),
                            bufLen);
    if (part) *part = 0;
    if (!buf && bufLen > 0) return tracer.setReturnStatus(JEX_FAILURE);
    return tracer.setReturnStatus(openPart(handle, "JexJtag_bsdl_openBuffer", part, [&] {
        return BsdlPart::fromBuffer(name ? name : "", buf, bufLen);
    }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_close(unsigned handle, unsigned part)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_close");
    Logger::logger.printLog(3, "JexJtag_bsdl_close() handle=%u, part=%u\n", handle, part);
    return tracer.setReturnStatus(guardedCall("JexJtag_bsdl_close", [&]() -> unsigned {
        Session* session = findSession(handle);
        return session && session->boundary().remove(part) ? JEX_SUCCESS : JEX_FAILURE;
    }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_getSummary(unsigned handle, unsigned part, JexBsdlSummary* summary)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_getSummary");
    Logger::logger.printLog(3, "JexJtag_bsdl_getSummary() handle=%u, part=%u\n", handle, part);
    return tracer.setReturnStatus(guardedCall("JexJtag_bsdl_getSummary", [&]() -> unsigned {
        const BsdlPart* bsdl = findPart(handle, part);
        if (!bsdl || !summary) return JEX_FAILURE;
        const jexbsdl::BsdlEntity& e = bsdl->entity();
        std::memset(summary, 0, sizeof *summary);
        copyField(summary->entity, e.name);
        copyField(summary->idcode, e.idcode);
        summary->irLength = e.instructionLength;
        summary->boundaryLength = static_cast<uint32_t>(e.boundary.size());
        summary->instructionCount = static_cast<uint32_t>(e.instructions.instructions().size());
        summary->pinCount = static_cast<uint32_t>(bsdl->pins().size());
        summary->registerAccessCount = static_cast<uint32_t>(e.registerAccess.entries().size());
        Logger::logger.printLog(3, "JexJtag_bsdl_getSummary() returning entity=%s, irLength=%u, boundaryLength=%u\n",
                                summary->entity, summary->irLength, summary->boundaryLength);
        return JEX_SUCCESS;
    }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_getInstruction(unsigned handle, unsigned part, unsigned index, char* name,
                                                 unsigned nameLen, char* opcodes, unsigned opcodesLen)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_getInstruction");
    Logger::logger.printLog(3, "JexJtag_bsdl_getInstruction() handle=%u, part=%u, index=%u, nameLen=%u, opcodesLen=%u\n",
                            handle, part, index, nameLen, opcodesLen);
    return tracer.setReturnStatus(guardedCall("JexJtag_bsdl_getInstruction", [&]() -> unsigned {
        const BsdlPart* bsdl = findPart(handle, part);
        if (!bsdl) return JEX_FAILURE;
        const auto& list = bsdl->entity().instructions.instructions();
        if (index >= list.size()) return JEX_FAILURE;
        copyCut(name, nameLen, list[index].name);
        copyCut(opcodes, opcodesLen, joined(list[index].opcodes));
        return JEX_SUCCESS;
    }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_getInstructionCapture(unsigned handle, unsigned part, char* capture,
                                                        unsigned captureLen)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_getInstructionCapture");
    Logger::logger.printLog(3, "JexJtag_bsdl_getInstructionCapture() handle=%u, part=%u, captureLen=%u\n", handle,
                            part, captureLen);
    return tracer.setReturnStatus(guardedCall("JexJtag_bsdl_getInstructionCapture", [&]() -> unsigned {
        const BsdlPart* bsdl = findPart(handle, part);
        if (!bsdl || !capture || captureLen == 0) return JEX_FAILURE;
        copyCut(capture, captureLen, bsdl->entity().instructionCapture);
        return JEX_SUCCESS;
    }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_getCell(unsigned handle, unsigned part, unsigned number, JexBsdlCell* cell)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_getCell");
    Logger::logger.printLog(3, "JexJtag_bsdl_getCell() handle=%u, part=%u, number=%u\n", handle, part, number);
    return tracer.setReturnStatus(guardedCall("JexJtag_bsdl_getCell", [&]() -> unsigned {
        const BsdlPart* bsdl = findPart(handle, part);
        if (!bsdl || !cell) return JEX_FAILURE;
        const auto& cells = bsdl->entity().boundary.cells();
        if (number >= cells.size()) return JEX_FAILURE;
        const Register::Cell& c = cells[number];
        std::memset(cell, 0, sizeof *cell);
        cell->number = c.number;
        cell->function = static_cast<uint32_t>(c.function);
        cell->controlCell = c.controlCell;
        cell->safe = c.safe;
        cell->disableValue = c.disableValue;
        copyField(cell->cellType, c.cellType);
        copyField(cell->port, c.port);
        copyField(cell->disableResult, c.disableResult);
        copyField(cell->mergedInput, c.mergedInput);
        return JEX_SUCCESS;
    }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_getPin(unsigned handle, unsigned part, unsigned index, JexBsdlPin* pin)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_getPin");
    Logger::logger.printLog(3, "JexJtag_bsdl_getPin() handle=%u, part=%u, index=%u\n", handle, part, index);
    return tracer.setReturnStatus(guardedCall("JexJtag_bsdl_getPin", [&]() -> unsigned {
        const BsdlPart* bsdl = findPart(handle, part);
        if (!bsdl || !pin || index >= bsdl->pins().size()) return JEX_FAILURE;
        const BsdlPart::Pin& p = bsdl->pins()[index];
        std::memset(pin, 0, sizeof *pin);
        copyField(pin->port, p.port);
        copyField(pin->pin, p.pin);
        pin->function = static_cast<uint32_t>(p.function);
        pin->cell = p.cell;
        pin->inputCell = p.inputCell;
        pin->outputCell = p.outputCell;
        pin->controlCell = p.controlCell;
        return JEX_SUCCESS;
    }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_getRegisterAccess(unsigned handle, unsigned part, unsigned index,
                                                    char* registerName, unsigned registerNameLen, unsigned* length,
                                                    char* instructions, unsigned instructionsLen)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_getRegisterAccess");
    Logger::logger.printLog(3, "JexJtag_bsdl_getRegisterAccess() handle=%u, part=%u, index=%u\n", handle, part,
                            index);
    return tracer.setReturnStatus(guardedCall("JexJtag_bsdl_getRegisterAccess", [&]() -> unsigned {
        const BsdlPart* bsdl = findPart(handle, part);
        if (!bsdl) return JEX_FAILURE;
        const auto& entries = bsdl->entity().registerAccess.entries();
        if (index >= entries.size()) return JEX_FAILURE;
        copyCut(registerName, registerNameLen, entries[index].registerName);
        if (length) *length = entries[index].length;
        copyCut(instructions, instructionsLen, joined(entries[index].instructions));
        return JEX_SUCCESS;
    }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_addDirectory(unsigned handle, const char* directory, unsigned* added)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_addDirectory");
    Logger::logger.printLog(3, "JexJtag_bsdl_addDirectory() handle=%u, directory=%s\n", handle, shown(directory));
    if (added) *added = 0;
    return tracer.setReturnStatus(guardedCall("JexJtag_bsdl_addDirectory", [&]() -> unsigned {
        Session* session = findSession(handle);
        if (!session || !directory) return JEX_FAILURE;
        unsigned count = 0;
        const bool ok = session->boundary().library().addDirectory(
            Jex_Util::trimWhitespace(directory), count, [&](const std::string& path, const std::string& reason) {
                session->sendMessage(JEX_MSG_WARNING, "BSDL library: " + path + " skipped: " + reason);
            });
        if (!ok) {
            session->sendMessage(JEX_MSG_ERROR, std::string("BSDL library: cannot read directory ") + directory + "\n");
            return JEX_FAILURE;
        }
        if (added) *added = count;
        Logger::logger.printLog(3, "JexJtag_bsdl_addDirectory() returning added=%u\n", count);
        return JEX_SUCCESS;
    }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_findByIdcode(unsigned handle, const char* idcode, char* entity,
                                               unsigned entityLen, unsigned* irLength, char* path,
                                               unsigned pathLen)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_findByIdcode");
    Logger::logger.printLog(3, "JexJtag_bsdl_findByIdcode() handle=%u, idcode=%s, entityLen=%u, pathLen=%u\n", handle,
                            shown(idcode), entityLen, pathLen);
    copyCut(entity, entityLen, "");
    copyCut(path, pathLen, "");
    if (irLength) *irLength = 0;
    return tracer.setReturnStatus(guardedCall("JexJtag_bsdl_findByIdcode", [&]() -> unsigned {
        Session* session = findSession(handle);
        if (!session || !idcode) return JEX_FAILURE;
        const BsdlLibrary::Entry* found = session->boundary().library().find(IDCode(idcode).getIDCode32());
        if (!found) return JEX_SUCCESS;
        copyCut(entity, entityLen, found->entity);
        copyCut(path, pathLen, found->path);
        if (irLength) *irLength = found->irLength;
        Logger::logger.printLog(3, "JexJtag_bsdl_findByIdcode() returning entity=%s, irLength=%u\n",
                                found->entity.c_str(), found->irLength);
        return JEX_SUCCESS;
    }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_sample(unsigned handle, unsigned deviceIndex, unsigned part, signed char* levels,
                                         unsigned levelCount, unsigned char* cells, unsigned cellsLen)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_sample");
    Logger::logger.printLog(3, "JexJtag_bsdl_sample() handle=%u, deviceIndex=%u, part=%u, levelCount=%u, cellsLen=%u\n",
                            handle, deviceIndex, part, levelCount, cellsLen);
    return tracer.setReturnStatus(guardedCall("JexJtag_bsdl_sample", [&]() -> unsigned {
        const BsdlPart* bsdl = findPart(handle, part);
        if (!bsdl || !levels || levelCount < bsdl->pins().size()) return JEX_FAILURE;
        if (cells && cellsLen < (bsdl->entity().boundary.size() + 7) / 8) return JEX_FAILURE;
        return withPins(handle, deviceIndex, part, [&](PinAccess& access, const BsdlPart&) {
            std::vector<int8_t> sampled;
            std::vector<uint8_t> bits;
            std::string error = access.sample(sampled, bits);
            if (!error.empty()) return error;
            copyLevels(sampled, levels);
            if (cells) {
                std::memset(cells, 0, cellsLen);
                for (size_t i = 0; i < bits.size(); ++i)
                    if (bits[i]) cells[i / 8] |= static_cast<unsigned char>(1u << (i % 8));
            }
            return error;
        });
    }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_extest(unsigned handle, unsigned deviceIndex, unsigned part, unsigned count,
                                         const char* const* pins, const char* values, signed char* levels,
                                         unsigned levelCount)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_extest");
    Logger::logger.printLog(3, "JexJtag_bsdl_extest() handle=%u, deviceIndex=%u, part=%u, count=%u, levelCount=%u\n",
                            handle, deviceIndex, part, count, levelCount);
    return tracer.setReturnStatus(guardedCall("JexJtag_bsdl_extest", [&]() -> unsigned {
        const BsdlPart* bsdl = findPart(handle, part);
        Session* session = findSession(handle);
        if (!bsdl || !session || (count > 0 && (!pins || !values))) return JEX_FAILURE;
        if (levels && levelCount < bsdl->pins().size()) return JEX_FAILURE;
        std::vector<std::pair<size_t, char>> settings;
        for (unsigned i = 0; i < count; ++i) {
            const char v = values[i];
            const long index = pins[i] ? bsdl->findPin(pins[i]) : -1;
            if (index < 0 || (v != '0' && v != '1' && v != 'z' && v != 'Z')) {
                session->sendMessage(JEX_MSG_ERROR, index < 0 ? "no pin " + std::string(shown(pins[i])) + " in " +
                                                                    bsdl->entity().name + "\n"
                                                              : "pin " + std::string(pins[i]) +
                                                                    ": a level is 0, 1 or z\n");
                return JEX_FAILURE;
            }
            settings.emplace_back(static_cast<size_t>(index), v);
        }
        return withPins(handle, deviceIndex, part, [&](PinAccess& access, const BsdlPart&) {
            std::vector<int8_t> read;
            std::string error = access.extest(settings, read);
            if (error.empty() && levels) copyLevels(read, levels);
            return error;
        });
    }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_highz(unsigned handle, unsigned deviceIndex, unsigned part)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_highz");
    Logger::logger.printLog(3, "JexJtag_bsdl_highz() handle=%u, deviceIndex=%u, part=%u\n", handle, deviceIndex, part);
    return tracer.setReturnStatus(guardedCall("JexJtag_bsdl_highz", [&]() -> unsigned {
        return withPins(handle, deviceIndex, part, [](PinAccess& access, const BsdlPart&) { return access.highz(); });
    }));
}

JEXJTAG_API uint32_t JexJtag_bsdl_clamp(unsigned handle, unsigned deviceIndex, unsigned part)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_bsdl_clamp");
    Logger::logger.printLog(3, "JexJtag_bsdl_clamp() handle=%u, deviceIndex=%u, part=%u\n", handle, deviceIndex, part);
    return tracer.setReturnStatus(guardedCall("JexJtag_bsdl_clamp", [&]() -> unsigned {
        return withPins(handle, deviceIndex, part, [](PinAccess& access, const BsdlPart&) { return access.clamp(); });
    }));
}

} // extern "C"
