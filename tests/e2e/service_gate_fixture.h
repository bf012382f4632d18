// Runs Action commands against the stand-in Suite service registered in the
// test's prefix as an out-of-process COM server.
#pragma once

#include <windows.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/service_stand_in.h"

class ServiceGateTest : public ::testing::Test {
protected:
    ServiceGateTest()
        : m_program(m_scratch.Sub(L"bin")), m_service(m_scratch.Sub(L"service"), &m_program) {}

    void SetUp() override { ASSERT_TRUE(m_service.registered()); }

    // Runs the command line; m_startMs and m_endMs bracket the process.
    RunResult Run(const std::wstring& commandLine, DWORD timeoutMs = 60000) {
        m_startMs = CounterMs();
        RunResult run = m_program.Run(commandLine, timeoutMs);
        m_endMs = CounterMs();
        ServiceStandIn::WaitForServersToEnd();
        return run;
    }

    static void ExpectCleanExit(const RunResult& run) {
        EXPECT_FALSE(run.crashed);
        EXPECT_FALSE(run.timedOut);
        EXPECT_EQ(0, run.exitCode);
    }

    // The text of the only call of method (empty when not exactly one).
    std::string OnlyDocument(const std::string& method) const {
        std::vector<ServiceEntry> calls = m_service.Calls(method);
        EXPECT_EQ(1u, calls.size()) << method;
        return calls.size() == 1 && calls[0].args.size() == 2 ? calls[0].args[0] : std::string();
    }

    ScratchDir m_scratch{L"gate"};
    ProgramUnderTest m_program;
    ServiceStandIn m_service;
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
