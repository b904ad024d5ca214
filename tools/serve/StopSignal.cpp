// SPDX-License-Identifier: MIT
#include "StopSignal.hpp"

#include <csignal>
#include <fcntl.h>
#include <stdexcept>
#include <unistd.h>

namespace jexjtag::serve {

namespace {

int g_pipe[2] = {-1, -1};
volatile std::sig_atomic_t g_requested = 0;
struct sigaction g_oldInt, g_oldTerm, g_oldPipe;

void onSignal(int)
{
    g_requested = 1;
    const char byte = 1;
    [[maybe_unused]] const ssize_t n = ::write(g_pipe[1], &byte, 1);
}

} // namespace

StopSignal::StopSignal()
{
    if (::pipe2(g_pipe, O_CLOEXEC | O_NONBLOCK) != 0) throw std::runtime_error("cannot create a pipe");
    g_requested = 0;
    struct sigaction action {};
    action.sa_handler = onSignal;
    sigemptyset(&action.sa_mask);
    sigaction(SIGINT, &action, &g_oldInt);
    sigaction(SIGTERM, &action, &g_oldTerm);
    struct sigaction ignore {};
    ignore.sa_handler = SIG_IGN;
    sigemptyset(&ignore.sa_mask);
    sigaction(SIGPIPE, &ignore, &g_oldPipe);
}

StopSignal::~StopSignal()
{
    sigaction(SIGINT, &g_oldInt, nullptr);
    sigaction(SIGTERM, &g_oldTerm, nullptr);
    sigaction(SIGPIPE, &g_oldPipe, nullptr);
    ::close(g_pipe[0]);
    ::close(g_pipe[1]);
    g_pipe[0] = g_pipe[1] = -1;
}

int StopSignal::fd() const { return g_pipe[0]; }

bool StopSignal::requested() const { return g_requested != 0; }

} // namespace jexjtag::serve
