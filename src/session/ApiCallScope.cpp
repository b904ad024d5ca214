// SPDX-License-Identifier: MIT
#include "session/ApiCallScope.hpp"

#include <deque>

namespace JexRT {

namespace {

// Plain thread-local values (no destructors): a host may call in from an
// atexit handler after the thread's own objects are gone.
thread_local unsigned t_depth = 0;
thread_local std::deque<std::function<void()>>* t_pending = nullptr;

void runPending() noexcept
{
    while (t_pending && !t_pending->empty()) {
        std::function<void()> work = std::move(t_pending->front());
        t_pending->pop_front();
        try {
            work();
        } catch (...) {
            // Deferred teardown has nobody to report to; what it held is lost.
        }
    }
    delete t_pending;
    t_pending = nullptr;
}

} // namespace

ApiCallScope::ApiCallScope() noexcept { ++t_depth; }

ApiCallScope::~ApiCallScope()
{
    // The depth stays 1 while the work runs: calls that the work causes are
    // nested and queue their own teardown behind it.
    if (t_depth == 1) runPending();
    --t_depth;
}

bool ApiCallScope::nested() noexcept { return t_depth > 1; }

void ApiCallScope::defer(std::function<void()> work)
{
    if (t_depth == 0) {
        work();
        return;
    }
    if (!t_pending) t_pending = new std::deque<std::function<void()>>();
    t_pending->push_back(std::move(work));
}

} // namespace JexRT
