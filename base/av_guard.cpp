#include "base/av_guard.h"

#include <windows.h>

// 32-bit Windows keeps a chain of exception registration records on the
// stack, headed at fs:[0]. The guard links one record for the duration of the
// call; its handler unwinds the frames above it and jumps back into the guard.

namespace {

struct GuardFrame {
    EXCEPTION_REGISTRATION_RECORD registration;  // must stay first
    void* resume[5];                             // __builtin_setjmp buffer
};

EXCEPTION_REGISTRATION_RECORD* ReadChainHead() {
    EXCEPTION_REGISTRATION_RECORD* head;
    __asm__ __volatile__("movl %%fs:0, %0" : "=r"(head));
    return head;
}

void WriteChainHead(EXCEPTION_REGISTRATION_RECORD* head) {
    __asm__ __volatile__("movl %0, %%fs:0" : : "r"(head) : "memory");
}

EXCEPTION_DISPOSITION __cdecl GuardHandler(EXCEPTION_RECORD* record, void* establisherFrame,
                                           CONTEXT* /*context*/, void* /*dispatcherContext*/) {
    if (record->ExceptionFlags & (EXCEPTION_UNWINDING | EXCEPTION_EXIT_UNWIND)) {
        return ExceptionContinueSearch;
    }
    if (record->ExceptionCode != EXCEPTION_ACCESS_VIOLATION) {
        OutputDebugStringA("didn't catch AV, unexpected.");
        return ExceptionContinueSearch;
    }
    OutputDebugStringA("caught AV as expected.");
    GuardFrame* frame = static_cast<GuardFrame*>(establisherFrame);
    // Let the frames between the fault and the guard run their unwind
    // handlers; afterwards the chain is headed by the guard's record.
    RtlUnwind(&frame->registration, nullptr, record, nullptr);
    __builtin_longjmp(frame->resume, 1);
}

}  // namespace

__attribute__((noinline)) bool RunWithAccessViolationGuard(void (*fn)(void*), void* context) {
    GuardFrame frame;
    frame.registration.Handler = reinterpret_cast<PEXCEPTION_ROUTINE>(&GuardHandler);
    frame.registration.Next = ReadChainHead();
    if (__builtin_setjmp(frame.resume) == 0) {
        WriteChainHead(&frame.registration);
        fn(context);
        WriteChainHead(frame.registration.Next);
        return true;
    }
    WriteChainHead(frame.registration.Next);
    return false;
}
