// SPDX-License-Identifier: MIT
// Exported SVF functions: play a file or text from memory on a session's
// open target, or check it without a cable.

#include <algorithm>
#include <cstring>
#include <memory>
#include <string>

#include "api/ApiGuard.hpp"
#include "jexjtag/svf.h"
#include "session/Session.hpp"
#include "session/SessionRegistry.hpp"
#include "svf/SvfError.hpp"
#include "svf/SvfInput.hpp"
#include "svf/SvfPlayer.hpp"
#include "target/Target.hpp"
#include "util/Logger.hpp"
#include "util/MethodLogger.hpp"

using namespace JexRT;

namespace {

// Copies text into buf, cut to size - 1 characters and NUL-terminated.
void copyCut(char* buf, uint32_t size, const std::string& text)
{
    if (!buf || size == 0) return;
    const size_t n = std::min<size_t>(text.size(), size - 1);
    std::memcpy(buf, text.data(), n);
    buf[n] = '\0';
}

// A vector as hex text in buf: whole when it fits, else the digits around
// bit `focus` that fit, marked "..." where cut.
void copyHex(char* buf, uint32_t size, const SvfBits& bits, uint64_t focus)
{
    if (buf && size > 0) copyCut(buf, size, bits.hex(size - 1, focus));
}

void clearResult(JexJtagSvfResult* r)
{
    if (!r) return;
    r->statements = r->checks = r->mismatches = r->firstMismatchLine = r->firstMismatchBit = r->errorLine = 0;
    r->outcome = JEXJTAG_SVF_PASSED;
    copyCut(r->expected, r->expectedSize, "");
    copyCut(r->actual, r->actualSize, "");
    copyCut(r->mask, r->maskSize, "");
    copyCut(r->message, r->messageSize, "");
}

// The common road of both play functions; makeInput builds the input and
// may throw SvfError (a file that cannot be opened).
template <typename MakeInput>
unsigned play(const char* function, unsigned handle, const std::string& name, const JexJtagSvfOptions* options,
              JexJtagSvfResult* result, MakeInput&& makeInput)
{
    clearResult(result);
    Session* session = findSession(handle);
    if (!session) return JEX_FAILURE;
    JexJtagSvfOptions defaults{};
    const JexJtagSvfOptions& o = options ? *options : defaults;
    const bool dry = (o.flags & JEXJTAG_SVF_DRY_RUN) != 0;
    if (Logger::logger.isEnabled(3))
        Logger::logger.printLog(3, "%s() handle=%u, name=%s, flags=0x%x, maxFrequencyHz=%.0f\n", function, handle,
                                name.c_str(), o.flags, o.maxFrequencyHz);

    const bool textTaken = result && result->message && result->messageSize > 0;
    auto fail = [&](JexJtagSvfOutcome outcome, const std::string& text) {
        if (!textTaken) session->sendMessage(JEX_MSG_ERROR, text);
        if (result) {
            result->outcome = outcome;
            copyCut(result->message, result->messageSize, text);
        }
        return JEX_FAILURE;
    };
    Target* target = nullptr;
    if (!dry) {
        target = findTarget(handle);
        if (!target || !target->isOpen()) return fail(JEXJTAG_SVF_CABLE, name + ": no open target to play on");
    }
    std::unique_ptr<SvfInput> input;
    try {
        input = makeInput();
    } catch (const SvfError& e) {
        return fail(JEXJTAG_SVF_BAD_FILE, name + ": " + e.what());
    }

    SvfPlayer::Options playerOptions;
    playerOptions.keepGoing = (o.flags & JEXJTAG_SVF_KEEP_GOING) != 0;
    playerOptions.maxHz = o.maxFrequencyHz > 0 ? o.maxFrequencyHz : 0;
    playerOptions.progress = o.progress;
    playerOptions.progressUser = o.progressUser;
    SvfPlayer player(session, target, handle, name, playerOptions);
    const JexJtagSvfOutcome outcome = player.play(*input);
    if (result) {
        result->statements = player.statements();
        result->checks = player.checks();
        result->mismatches = player.mismatches();
        result->firstMismatchLine = player.firstMismatch().line;
        result->firstMismatchBit = player.firstMismatch().bit;
        result->errorLine = player.errorLine();
        result->outcome = outcome;
        const SvfPlayer::Mismatch& first = player.firstMismatch();
        if (first.line) {
            copyHex(result->expected, result->expectedSize, first.expected, first.bit);
            copyHex(result->actual, result->actualSize, first.actual, first.bit);
            copyHex(result->mask, result->maskSize, first.mask, first.bit);
        }
        copyCut(result->message, result->messageSize, player.errorText());
    }
    if (!textTaken && !player.errorText().empty()) session->sendMessage(JEX_MSG_ERROR, player.errorText());
    Logger::logger.printLog(3, "%s() statements=%llu, checks=%llu, mismatches=%llu, outcome=%u\n", function,
                            static_cast<unsigned long long>(player.statements()),
                            static_cast<unsigned long long>(player.checks()),
                            static_cast<unsigned long long>(player.mismatches()), static_cast<unsigned>(outcome));
    return outcome == JEXJTAG_SVF_PASSED ? JEX_SUCCESS : JEX_FAILURE;
}

} // namespace

extern "C" {

JEXJTAG_API uint32_t JexJtag_svf_initOptions(JexJtagSvfOptions* options)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_svf_initOptions");
    if (!options) return tracer.setReturnStatus(JEX_FAILURE);
    *options = JexJtagSvfOptions{};
    return tracer.setReturnStatus(JEX_SUCCESS);
}

JEXJTAG_API uint32_t JexJtag_svf_playFile(unsigned handle, const char* path, const JexJtagSvfOptions* options,
                                          JexJtagSvfResult* result)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_svf_playFile");
    const unsigned status = guardedCall("JexJtag_svf_playFile", [&]() -> unsigned {
        if (!path) {
            clearResult(result);
            return JEX_FAILURE;
        }
        const std::string name(path);
        return play("JexJtag_svf_playFile", handle, name, options, result,
                    [&]() { return std::make_unique<SvfInput>(name); });
    });
    return tracer.setReturnStatus(status);
}

JEXJTAG_API uint32_t JexJtag_svf_playText(unsigned handle, const char* text, size_t length, const char* name,
                                          const JexJtagSvfOptions* options, JexJtagSvfResult* result)
{
    MethodLogger tracer;
    tracer.setMethodName("JexJtag_svf_playText");
    const unsigned status = guardedCall("JexJtag_svf_playText", [&]() -> unsigned {
        if (!text && length != 0) {
            clearResult(result);
            return JEX_FAILURE;
        }
        return play("JexJtag_svf_playText", handle, name ? name : "<text>", options, result,
                    [&]() { return std::make_unique<SvfInput>(text, length); });
    });
    return tracer.setReturnStatus(status);
}

} // extern "C"
