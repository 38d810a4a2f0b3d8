// Signals as the standard library knows them, which is the same on all systems.
#include "interruption.h"

#include <csignal>

namespace {

volatile std::sig_atomic_t requested_signal = 0;

extern "C" void note_request(int signal) {
    requested_signal = signal;
    std::signal(signal, SIG_DFL);
}

using Handler = void (*)(int);

Handler watch(int signal) {
    const Handler before = std::signal(signal, note_request);
    if (before == SIG_IGN) std::signal(signal, SIG_IGN);
    return before;
}

void restore(int signal, Handler before) {
    if (before != SIG_ERR) std::signal(signal, before);
}

}  // namespace

Interruption::Interruption() : on_interrupt_(watch(SIGINT)), on_terminate_(watch(SIGTERM)) {}

Interruption::~Interruption() {
    restore(SIGINT, on_interrupt_);
    restore(SIGTERM, on_terminate_);
}

bool Interruption::requested() {
    return requested_signal != 0;
}

void Interruption::follow() {
    const int signal = requested_signal;
    if (signal == 0) return;
    std::signal(signal, SIG_DFL);
    std::raise(signal);
}
