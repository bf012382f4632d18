// CFeedbackSender: hands the feedback document to the suite program that
// started us, by WM_COPYDATA to its window or, without a window, through the
// shared memory "MRVPPUINFO" that program created.
#pragma once

#include <windows.h>

#include "base/string_ex.h"

class CFeedbackSender {
public:
    explicit CFeedbackSender(HWND target);
    virtual ~CFeedbackSender();
    CFeedbackSender(const CFeedbackSender&) = delete;
    CFeedbackSender& operator=(const CFeedbackSender&) = delete;

    // Stores text; 1 when it is accepted.
    int SetFeedback(const wchar_t* text);
    // 1 when the feedback was delivered, 0 when it could not be.
    int Send();

protected:
    // A sender without feedback sends the plain failure document.
    virtual int Validate();

private:
    int SendToSharedMemory();

    int m_state = 0;  // 0 no feedback set, 1 set
    CStringEx m_feedback;
    HWND m_target;
};
