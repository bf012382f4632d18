// Runs Action commands against the stand-in Suite service registered in the
// test's prefix as an out-of-process COM server.
#pragma once

#include <windows.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/fakes/qmsrv/fake_script.h"
#include "tests/fakes/qmsrv/stand_in_control.h"
#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/test_paths.h"

class ServiceGateTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(m_service.registered());
        m_program.SetEnv(L"QM_FAKE_QMSRV_SCRIPT", m_service.scriptPath());
        m_program.SetEnv(L"QM_FAKE_QMSRV_LOG", m_service.logPath());
    }

    // Runs the command line with the script; m_endMs is when it ended.
    RunResult Run(const std::string& script, const std::wstring& commandLine,
                  DWORD timeoutMs = 60000) {
        m_service.SetScript(script);
        m_startMs = fake::CounterMs();
        RunResult run = m_program.Run(commandLine, timeoutMs);
        m_endMs = fake::CounterMs();
        ServiceStandIn::WaitForServersToEnd();
        EXPECT_FALSE(run.crashed);
        EXPECT_FALSE(run.timedOut);
        EXPECT_EQ(0, run.exitCode);
        return run;
    }

    // The document of the only call of method.
    std::string OnlyDocument(const std::string& method) const {
        std::vector<ServiceEntry> calls = m_service.Calls(method);
        EXPECT_EQ(1u, calls.size()) << method;
        return calls.size() == 1 && calls[0].args.size() == 2 ? calls[0].args[0] : std::string();
    }

    ScratchDir m_scratch{L"gate"};
    ProgramUnderTest m_program{m_scratch.Sub(L"bin")};
    ServiceStandIn m_service{FakePath(L"qmSrv.exe"), m_scratch.Sub(L"service", true)};
    double m_startMs = 0;
    double m_endMs = 0;
};

// True when the parts occur in text in this order.
inline bool InOrder(const std::string& text, const std::vector<std::string>& parts) {
    size_t at = 0;
    for (const std::string& part : parts) {
        at = text.find(part, at);
        if (at == std::string::npos) {
            return false;
        }
        at += part.size();
    }
    return true;
}
