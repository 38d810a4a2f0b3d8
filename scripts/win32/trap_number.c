/* Preloaded into Wine under user-mode qemu. qemu leaves the trap number out of a signal frame (-1),
 * but Wine tells an access violation from other faults by it. So this stands between Wine and the C
 * library: a handler that Wine sets for a fault runs after the number has been filled in. Uses no
 * header and no library: a 64-bit compiler without 32-bit headers must be able to build it. */

enum { kSigIll = 4, kSigTrap = 5, kSigBus = 7, kSigFpe = 8, kSigSegv = 11 };
enum { kSaSiginfo = 4 };

/* struct sigaction, siginfo_t and the place of the trap number in a ucontext_t, on 32-bit Linux. */
typedef struct {
    unsigned handler;
    unsigned mask[32];
    int flags;
    unsigned restorer;
} Action;
typedef struct {
    int signal;
    int error;
    int code;
} SignalInfo;
enum { kTrapNumberWord = 5 + 12 };

typedef void (*Handler)(int signal, SignalInfo* info, unsigned* context);
typedef int (*SetAction)(int signal, const Action* action, Action* old);

extern void* dlsym(void* module, const char* name);
#define NEXT_MODULE ((void*)-1)

static unsigned handlers[65];

/* Numbers of the processor: 0 divide, 1 single step, 3 breakpoint, 4 overflow, 6 invalid opcode, 13
 * protection, 14 page fault, 16 floating point, 17 alignment. */
static unsigned trap_number(int signal, int code) {
    switch (signal) {
        case kSigIll:
            return 6;
        case kSigTrap:
            return code == 0x80 ? 3 : 1;
        case kSigBus:
            return code == 1 ? 17 : 14;
        case kSigFpe:
            return code == 1 ? 0 : code == 2 ? 4 : 16;
        default:
            return code == 1 || code == 2 ? 14 : 13;
    }
}

static void fill_in(int signal, SignalInfo* info, unsigned* context) {
    if (context[kTrapNumberWord] == 0xFFFFFFFFU) {
        context[kTrapNumberWord] = trap_number(signal, info->code);
    }
    ((Handler)handlers[signal])(signal, info, context);
}

static int is_fault(int signal) {
    return signal == kSigIll || signal == kSigTrap || signal == kSigBus || signal == kSigFpe ||
           signal == kSigSegv;
}

int sigaction(int signal, const Action* action, Action* old) {
    static SetAction next;
    Action replaced;
    unsigned before;
    int result;
    if (!next) next = (SetAction)dlsym(NEXT_MODULE, "sigaction");
    if (!is_fault(signal)) return next(signal, action, old);
    before = handlers[signal];
    if (action && (action->flags & kSaSiginfo) && action->handler > 1) {
        replaced = *action;
        handlers[signal] = action->handler;
        replaced.handler = (unsigned)fill_in;
        action = &replaced;
    }
    result = next(signal, action, old);
    if (!result && old && old->handler == (unsigned)fill_in) old->handler = before;
    return result;
}
