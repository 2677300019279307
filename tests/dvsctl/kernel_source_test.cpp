/* SPDX-License-Identifier: Apache-2.0 */
// The source kernel: and all failures between the program and the module: no device, and a module that
// rejects requests, hangs, dies or sends invalid replies.

#include <csignal>

#include <unistd.h>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>

#include "kernel_fixture.h"

namespace {

using namespace dvs::ctl::test;

class KernelSource : public KernelTest {};

TEST_F(KernelSource, ShowsAndVerifiesTheLiveState) {
    EXPECT_EQ(Json(Kernel({"show", "kernel:", "--json"})).at("switches").as_array().size(), 2u);
    EXPECT_EQ(Kernel({"verify", "kernel:"}).out.find("kernel: sound, 2 switches"), 0u);
    EXPECT_EQ(Kernel({"show", "kernel:"}).out.find("kernel: 2 switches"), 0u);
    EXPECT_EQ(Kernel({"verify", At("start.db")}).out.find("file:" + At("start.db") + ": sound"), 0u);
    const Result planned = Kernel({"copy", "--dry-run", At("start.db"), "kernel:"});
    EXPECT_EQ(planned.out.find("::"), std::string::npos) << planned.out;
    EXPECT_EQ(Kernel({"show", "kernel:", "--switch", "none"}).status, 4);
    EXPECT_EQ(Kernel({"show", "kernel:1"}).status, 2);
}

TEST_F(KernelSource, PersistentOmitsVolatileState) {
    EXPECT_NE(Kernel({"show", "kernel:"}).out.find("shadow of 1"), std::string::npos);
    EXPECT_EQ(Kernel({"show", "kernel:", "--persistent"}).out.find("shadow of 1"), std::string::npos);
    EXPECT_EQ(Kernel({"diff", "kernel:", "kernel:", "--persistent"}).status, 0);
}

TEST_F(KernelSource, CopiesRoundTripThroughFiles) {
    ASSERT_EQ(Kernel({"copy", "kernel:", At("live.db")}).status, 0);
    ASSERT_EQ(Verb({"prop", "set", "alpha", "x.mtu", "1", "--as", "number"}).status, 0);
    EXPECT_EQ(Kernel({"diff", "kernel:", At("live.db")}).status, 1);
    const std::string before = Everything();
    const Result plan = Kernel({"copy", At("live.db"), "kernel:", "--dry-run", "--json"});
    EXPECT_EQ(Json(plan).at("changes").as_array().size(), 1u);
    EXPECT_EQ(Everything(), before);
    EXPECT_EQ(Kernel({"copy", At("live.db"), "kernel:", "--no-replace"}).status, 1);
    EXPECT_EQ(Kernel({"copy", At("live.db"), "kernel:", "--switch", "alpha"}).status, 2);
    EXPECT_EQ(Everything(), before);
    ASSERT_EQ(Kernel({"copy", At("live.db"), "kernel:"}).status, 0);
    EXPECT_EQ(Kernel({"diff", "kernel:", At("live.db")}).status, 0);
}

TEST_F(KernelSource, CopyIntoTheStoreUsesThePersistentState) {
    ASSERT_EQ(Kernel({"copy", "json:" DVS_SOURCE_DIR "/examples/site-basic.json", "kernel:"}).status, 0);
    EXPECT_NE(Verb({"ports", "production"}).out.find("shadow"), std::string::npos);
    ASSERT_EQ(Kernel({"copy", "kernel:", "store:"}).status, 0);
    ASSERT_EQ(Verb({"state", "cleanup"}).status, 0);
    const Result back = Kernel({"copy", "store:", "kernel:"});
    ASSERT_EQ(back.status, 0) << back.err;
    EXPECT_EQ(Verb({"port", "find", "production", "web-1"}).status, 0);
    EXPECT_EQ(Verb({"ports", "production"}).out.find("shadow"), std::string::npos);
}

TEST_F(KernelSource, MissingDeviceErrorSuggestsAFix) {
    for (const std::vector<std::string> &args : {std::vector<std::string>{"show", "kernel:"},
                                                 {"copy", At("start.db"), "kernel:"},
                                                 {"kernel", "switch", "remove", "alpha"},
                                                 {"kernel", "exec", "", "help"},
                                                 {"kernel", "ports", "alpha", "--json"}}) {
        const Result result = RunProgram({.args = args});
        EXPECT_EQ(result.status, 5) << args[0];
        EXPECT_NE((result.out + result.err).find("DVS_EMULATOR"), std::string::npos) << result.err;
    }
    emulator_.Stop(SIGTERM);
    const Result gone = Kernel({"show", "kernel:"});
    EXPECT_EQ(gone.status, 5);
    EXPECT_NE(gone.err.find(Socket()), std::string::npos);
    EXPECT_NE(gone.err.find("cause:  failed to open dvsdev device"), std::string::npos) << gone.err;
}

TEST_F(KernelSource, ModuleFaultsGiveClearErrors) {
    const struct {
        const char *fault;
        int status;
        const char *says;
    } rows[] = {
        {"command=5,nth=1,errno=EBUSY", 8, "busy"},
        {"command=5,nth=1,errno=EIO", 1, "ioctl failed: Input/output error"},
        {"command=5,nth=1,status=0x0bad0014", 1, "memory"},
        {"command=5,nth=1,status=0x0bad0006", 1, "limit"},
        {"command=5,nth=1,status=0x0bad0077", 1, "0x0bad0077"},
        {"command=5,nth=1,drop", 1, "failed"},
    };
    const std::string before = Everything();
    for (const auto &row : rows) {
        Fault(row.fault);
        const Result result = Verb({"switch", "remove", "alpha"});
        EXPECT_EQ(result.status, row.status) << row.fault << result.err;
        EXPECT_NE(result.err.find(row.says), std::string::npos) << row.fault << '\n' << result.err;
        EXPECT_EQ(Everything(), before) << row.fault;
    }
    Fault("command=0,nth=1,status=0x0bad0006");
    EXPECT_EQ(Kernel({"copy", At("start.db"), "kernel:"}).status, 1);
    Fault("command=3,nth=1,status=0x0bad0014");
    EXPECT_EQ(Kernel({"show", "kernel:"}).status, 1);
    Fault("command=3,nth=1,errno=EBUSY"); // a fetch prints nothing about it
    EXPECT_EQ(Kernel({"show", "kernel:"}).status, 8);
}

TEST_F(KernelSource, HangingModuleTimesOut) {
    Fault("command=3,nth=1,delay=30s");
    const Result late = Kernel({"show", "kernel:", "--timeout", "0.2", "--json"});
    EXPECT_EQ(late.status, 3);
    EXPECT_EQ(Json(late).at("error").at("name"), "timeout");
    kill(emulator_.Pid(), SIGSTOP);
    EXPECT_EQ(Kernel({"verify", "kernel:", "--timeout", "0.2"}).status, 3);
    EXPECT_EQ(Verb({"prop", "get", "alpha", "x.mtu", "--timeout", "0.2"}).status, 3);
    EXPECT_EQ(Verb({"switch", "remove", "alpha", "--timeout", "0.2"}).status, 3);
    kill(emulator_.Pid(), SIGCONT);
}

} // namespace
