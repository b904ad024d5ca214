// SPDX-License-Identifier: MIT
#pragma once
// ApiCallScope - marks an exported function as running on this thread.
//
// A host's message callback runs inside library and plug-in calls, and may
// call back in: destroy its session, close its target, create sessions.
// What the running call uses must stay alive until it returns, so such a
// destruction, asked for while another exported call is under way on the
// same thread (nested()), is deferred: defer() queues it, and it runs when
// the outermost call on this thread returns, before that call's caller
// gets control back.  Work queued while deferred work runs is run too, in
// the order it was queued.

#include <functional>

namespace JexRT {

class ApiCallScope {
public:
    ApiCallScope() noexcept;
    // The outermost scope of the thread runs the deferred work.
    ~ApiCallScope();
    ApiCallScope(const ApiCallScope&) = delete;
    ApiCallScope& operator=(const ApiCallScope&) = delete;

    // True when this thread is inside an exported call that itself runs
    // inside another one (a call from a callback).
    static bool nested() noexcept;
    // Queues work for the end of the outermost call of this thread.  Runs
    // it at once when no exported call is under way here.
    static void defer(std::function<void()> work);
};

} // namespace JexRT
