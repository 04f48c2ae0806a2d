// SPDX-License-Identifier: MIT
#include "diag/debug_trace.h"

#include <doctest/doctest.h>

#include "platform/registry.h"
#include "platform/thread_id.h"
#include "tests/support/debug_capture.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

const WideString kSwitches = VX_TEXT("Software\\Ondrevale\\Logging\\APO");

// A logger that is on, with a tag.
struct Logger : CTraceFuncCallTarget {
    explicit Logger(const VXWCHAR *tag = VX_TEXT("TAG")) {
        setTraceTag(*this, tag);
        Enabled = 1;
    }
    std::string prefix() const {
        return toUtf8(Tag) + "[" + std::to_string(InstanceId) + ":" + std::to_string(static_cast<int32_t>(currentThreadId())) +
               "]: ";
    }
};

using Lines = std::vector<std::string>;

}  // namespace

TEST_CASE("the switch is a 4-byte value that isn't 0; no key, no value or another size is off") {
    RegistryKey key;
    CHECK_FALSE(readLoggingSwitch(VX_TEXT("NoSuchSubkey"), VX_TEXT("VXCOMAPI")));
    REQUIRE_EQ(RegistryKey::create(RegistryRoot::localMachine, kSwitches, RegistryAccess::readWrite, key), status::ok);
    CHECK_FALSE(readLoggingSwitch(VX_TEXT("APO"), VX_TEXT("Missing")));
    CHECK_EQ(key.setU32(VX_TEXT("TestSwitch"), 1), status::ok);
    CHECK(readLoggingSwitch(VX_TEXT("APO"), VX_TEXT("TestSwitch")));
    CHECK_EQ(key.setU32(VX_TEXT("TestSwitch"), 0), status::ok);
    CHECK_FALSE(readLoggingSwitch(VX_TEXT("APO"), VX_TEXT("TestSwitch")));
    CHECK_EQ(key.setU32(VX_TEXT("TestSwitch"), 0x80000000U), status::ok);
    CHECK(readLoggingSwitch(VX_TEXT("APO"), VX_TEXT("TestSwitch")));
    CHECK_EQ(key.setU64(VX_TEXT("TestSwitch"), 1), status::ok);
    CHECK_FALSE(readLoggingSwitch(VX_TEXT("APO"), VX_TEXT("TestSwitch")));
    CHECK_EQ(key.deleteValue(VX_TEXT("TestSwitch")), status::ok);
}

TEST_CASE("a new logger is zero, logs to itself and is off; its first tag gives it a number") {
    CTraceFuncCallTarget logger;
    CHECK_EQ(logger.InstanceId, 0);
    CHECK_EQ(logger.Enabled, 0);
    CHECK_EQ(logger.TraceTarget, &logger);
    CHECK_EQ(logger.FileEnabled, 0);
    CHECK_EQ(logger.LogFile, nullptr);
    setTraceTag(logger, VX_TEXT("ONE"));
    const uint32_t number = logger.InstanceId;
    CHECK(number != 0);
    setTraceTag(logger, VX_TEXT("TWO"));
    CHECK_EQ(logger.InstanceId, number);
    CHECK_EQ(toUtf8(logger.Tag), "TWO");
    CTraceFuncCallTarget other;
    setTraceTag(other, VX_TEXT("ONE"));
    CHECK_EQ(other.InstanceId, number + 1);
    setTraceTag(other, WideString(1000, VX_TEXT('x')).c_str());
    CHECK_EQ(WideString(other.Tag).size(), 255);
}

TEST_CASE("lines bear tag, number and thread and go to the debugger output") {
    DebugCapture capture;
    const Logger logger;
    logger.log(VX_TEXT("value = %i\n"), 5);
    CHECK_EQ(capture.lines(), Lines{logger.prefix() + "value = 5"});
}

TEST_CASE("with logging off the debugger output is never called") {
    DebugCapture capture;
    Logger logger;
    logger.Enabled = 0;
    logger.log(VX_TEXT("value = %i\n"), 5);
    { const TraceScope scope(&logger, VX_TEXT("Function")); }
    const TraceScope nobody(nullptr, VX_TEXT("Function"));
    CHECK_EQ(capture.lines(), Lines{});
    CHECK_EQ(logger.Depth, 0);
}

TEST_CASE("a trace scope's exit line has the same indentation as its entry line") {
    DebugCapture capture;
    Logger logger(VX_TEXT("VXCOMAPIU"));
    {
        const TraceScope outer(&logger, VX_TEXT("Outer"));
        {
            const TraceScope inner(&logger, VX_TEXT("VXAPOCOMAPI_FreeAPI"), VX_TEXT("apiHandle = 0x12345678"));
            logger.log(VX_TEXT("inside\n"));
        }
    }
    const std::string p = logger.prefix();
    CHECK_EQ(capture.lines(), Lines{p + "{ Outer()", p + "  { VXAPOCOMAPI_FreeAPI(apiHandle = 0x12345678)", p + "    inside",
                                    p + "  } VXAPOCOMAPI_FreeAPI(apiHandle = 0x12345678)", p + "} Outer()"});
}

TEST_CASE("an argument text that holds a percent sign is taken for a format directive") {
    DebugCapture capture;
    Logger logger;
    { const TraceScope scope(&logger, VX_TEXT("F"), VX_TEXT("name = 100%%, %s%n%i")); }
    const std::string p = logger.prefix();
    CHECK_EQ(capture.lines(), Lines{p + "{ F(name = 100%, )", p + "} F(name = 100%, )"});
}

TEST_CASE("the depth is held to 1023 and to 0") {
    Logger logger;
    for (int i = 0; i < 600; ++i) indentTrace(logger);
    CHECK_EQ(logger.Depth, 1023);
    CHECK_EQ(std::string(logger.IndentA), std::string(1023, ' '));
    CHECK_EQ(WideString(logger.IndentW).size(), 1023);
    for (int i = 0; i < 600; ++i) outdentTrace(logger);
    CHECK_EQ(logger.Depth, 0);
    CHECK_EQ(logger.IndentA[0], 0);
    CHECK_EQ(logger.IndentW[1000], 0);
}

TEST_CASE("a scope that an exception passes comes out again") {
    Logger logger;
    try {
        const TraceScope scope(&logger, VX_TEXT("F"));
        CHECK_EQ(logger.Depth, 2);
        throw std::runtime_error("passes");
    } catch (const std::runtime_error &) {
        CHECK_EQ(logger.Depth, 0);
    }
}

TEST_CASE("a line longer than the buffer is cut to 4095 characters with its prefix") {
    DebugCapture capture;
    const Logger logger;
    logger.log(VX_TEXT("%s"), std::string(10000, 'x'));
    REQUIRE_EQ(capture.lines().size(), 1);
    CHECK_EQ(capture.lines()[0].size(), 4095);
}

TEST_CASE("lines of a logger whose target is another go out under the other's tag") {
    DebugCapture capture;
    Logger host(VX_TEXT("HOST"));
    Logger guest(VX_TEXT("GUEST"));
    guest.TraceTarget = &host;
    guest.log(VX_TEXT("hello\n"));
    guest.TraceTarget = nullptr;
    guest.log(VX_TEXT("nobody\n"));
    CHECK_EQ(capture.lines(), Lines{host.prefix() + "hello"});
}

TEST_CASE("the file sink writes each line with its time in UTF-8") {
    DebugCapture capture;
    Logger logger;
    const TemporaryLog file;
    logger.LogFile = file.handle();
    logger.FileEnabled = 1;
    logger.log(VX_TEXT("gr\u00FC\u00DFe\n"));
    const std::string text = file.text();
    REQUIRE(text.size() > 24);
    CHECK_EQ(text[0], '[');
    CHECK_EQ(text.substr(20, 2), "]\t");
    CHECK_EQ(text.substr(22), logger.prefix() +
                                  "gr\xC3\xBC\xC3\x9F"
                                  "e\n\r\n");
    CHECK_EQ(capture.lines().size(), 1);
}
