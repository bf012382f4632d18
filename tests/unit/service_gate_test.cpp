// The Suite service gate's rules that no command line shows, checked in this
// process: the login answer's reading, and against the stand-in service (out
// of process) the busy flag of a wrapper called again from inside an event
// and the client kinds that send no request.
#include <windows.h>
#include <gtest/gtest.h>

#include <functional>

#include "actions/service_gate.h"
#include "actions/service_requests.h"
#include "tests/fakes/qmsrv/stand_in_control.h"
#include "tests/support/file_util.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/test_paths.h"

namespace {

TEST(LoginAnswer, SucceedsWhenTheResultBeginsWithSuccessInAnyCase) {
    CoInitialize(nullptr);
    const struct {
        const wchar_t* result;  // null: no LoginResult element
        int success;
    } rows[] = {{L"SUCCESS", 1}, {L"successful", 1}, {L"succes", 0}, {L"fail", 0}, {nullptr, 0}};
    for (const auto& row : rows) {
        std::wstring text =
            L"<Mirovan_QM><Func_Params>" +
            (row.result ? L"<LoginResult>" + std::wstring(row.result) + L"</LoginResult>"
                        : std::wstring(L"<Other>success</Other>")) +
            L"</Func_Params></Mirovan_QM>";
        UniqueBstr response(SysAllocString(text.c_str()));
        EXPECT_EQ(row.success, ReadLoginResult(response.get())) << Narrow(text);
    }
    UniqueBstr notXml(SysAllocString(L"success"));
    EXPECT_EQ(0, ReadLoginResult(notXml.get()));
    EXPECT_EQ(0, ReadLoginResult(nullptr));
    CoUninitialize();
}

class GateInProcessTest : public ::testing::Test {
protected:
    GateInProcessTest() { CoInitialize(nullptr); }
    ~GateInProcessTest() override { CoUninitialize(); }
    void SetUp() override { ASSERT_TRUE(m_service.registered()); }

    ScratchDir m_scratch{L"gateunit"};
    ServiceStandIn m_service{FakePath(L"qmSrv.exe"), m_scratch.Sub(L"service", true)};
};

// Runs a callback for every event it receives.
class CallbackSink : public DispatchEventSink {
public:
    CallbackSink(const IID& events, std::function<void()> onEvent)
        : DispatchEventSink(events), m_onEvent(std::move(onEvent)) {}

protected:
    HRESULT OnInvoke(DISPID, const DISPPARAMS&) override {
        m_onEvent();
        return S_OK;
    }

private:
    std::function<void()> m_onEvent;
};

TEST_F(GateInProcessTest, MeetingCallFromInsideAnEventOfACallIsTurnedAway) {
    m_service.SetScript("Event=StartOCMeeting Meeting 96 sync 1\n");
    CIMeetingWrapper meeting;
    ASSERT_TRUE(meeting.CreateInstance());
    long nested = 0;
    CallbackSink sink(DIID__IMeetingEvents, [&] { nested = meeting.GetLastError(); });
    ASSERT_EQ(S_OK, meeting.Advise(&sink));
    EXPECT_EQ(0, meeting.StartOCMeeting(nullptr));
    EXPECT_EQ(static_cast<long>(RPC_E_CANTCALLOUT_ININPUTSYNCCALL), nested);
    EXPECT_TRUE(m_service.Calls("GetLastError").empty());
    meeting.ReleaseInstance();
}

TEST_F(GateInProcessTest, BooleanCallFromInsideAnEventAnswersTheCodesLowBits) {
    m_service.SetScript("HasValidAccount=0\nEvent=OpenSettingDlg Setting 4 sync 1 2\n");
    CISettingWrapper setting;
    ASSERT_TRUE(setting.CreateInstance());
    VARIANT_BOOL nested = VARIANT_FALSE;
    CallbackSink sink(DIID__ISettingEvents, [&] { nested = setting.HasValidAccount(); });
    ASSERT_EQ(S_OK, setting.Advise(&sink));
    EXPECT_EQ(0, setting.OpenSettingDlg(nullptr));
    EXPECT_EQ(0x010D, nested);
    setting.ReleaseInstance();
}

TEST_F(GateInProcessTest, ClientKindsOtherThanOIAndNISendNoRequest) {
    CServiceGate gate;
    ASSERT_EQ(1, gate.Init());
    for (int kind : {2, 3, -1}) {
        EXPECT_EQ(0, gate.StartOCMeeting(kind, 0)) << kind;
    }
    EXPECT_EQ(1, gate.StartOCMeeting(1, 0));
    EXPECT_EQ(1u, m_service.Calls("StartOCMeeting").size());
    gate.Uninit();
}

}  // namespace
