#include "actions/feedback_sender.h"

#include <cstring>

#include "base/trace.h"
#include "base/unique_resource.h"
#include "base/win_handles.h"

namespace {

const wchar_t kSharedMemoryName[] = L"MRVPPUINFO";
const wchar_t kPlainFailure[] = L"<Feedback><Status>Failed</Status></Feedback>";

void UnmapView(void* view) {
    UnmapViewOfFile(view);
}
using UniqueMappedView = UniqueResource<NullIsNoneTraits<void*, UnmapView>>;

// Bytes the view offers from its start: the receiver chose the mapping's size.
SIZE_T ViewBytes(const void* view) {
    MEMORY_BASIC_INFORMATION info = {};
    if (VirtualQuery(view, &info, sizeof(info)) != sizeof(info)) {
        return 0;
    }
    return info.RegionSize;
}

}  // namespace

CFeedbackSender::CFeedbackSender(HWND target) : m_target(target) {}

CFeedbackSender::~CFeedbackSender() = default;

int CFeedbackSender::SetFeedback(const wchar_t* text) {
    m_state = 1;
    m_feedback = text;
    int valid = Validate();
    if (valid == 0) {
        m_feedback.Empty();
        m_state = 0;
    }
    return valid;
}

int CFeedbackSender::Validate() {
    if (m_state == 0) {
        m_feedback = kPlainFailure;
        return 1;
    }
    return m_state == 1 ? 1 : 0;
}

int CFeedbackSender::Send() {
    if (!IsWindow(m_target)) {
        return SendToSharedMemory();
    }
    COPYDATASTRUCT data = {};
    data.dwData = 0;
    data.cbData = static_cast<DWORD>((m_feedback.GetLength() + 1) * sizeof(wchar_t));
    data.lpData = const_cast<wchar_t*>(m_feedback.c_str());
    SendMessageW(m_target, WM_COPYDATA, 0, reinterpret_cast<LPARAM>(&data));
    return 1;
}

int CFeedbackSender::SendToSharedMemory() {
    UniqueHandle mapping(OpenFileMappingW(FILE_MAP_ALL_ACCESS, FALSE, kSharedMemoryName));
    if (!mapping) {
        TraceLevel8(TraceValue("Could not open file-mapping object."));
        return 0;
    }
    UniqueMappedView view(MapViewOfFile(mapping.get(), FILE_MAP_ALL_ACCESS, 0, 0, 0));
    if (!view) {
        TraceLevel8(TraceValue("Could not map view of file.\n"));
        return 0;
    }
    // The receiver decides the mapping's size: a feedback that does not fit
    // is not written at all rather than cut or written past the view.
    SIZE_T bytes = (static_cast<SIZE_T>(m_feedback.GetLength()) + 1) * sizeof(wchar_t);
    SIZE_T room = ViewBytes(view.get());
    if (bytes > room) {
        TraceLevel8(TraceValue("CFeedbackSender::Send: Feedback larger than the view of file"),
                    TraceNamed("cbFeedback", static_cast<unsigned long>(bytes)),
                    TraceNamed("cbView", static_cast<unsigned long>(room)));
        return 0;
    }
    memcpy(view.get(), m_feedback.c_str(), bytes);
    return 1;
}
