/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_DVSCTL_STORE_FIXTURE_H
#define TESTS_DVSCTL_STORE_FIXTURE_H

// A state file, a store with the same state, and the program that runs on them.

#include <string>
#include <utility>
#include <vector>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <gtest/gtest.h>

#include "program.h"

namespace dvs::ctl::test {

class StoreProgram : public ProgramTest {
protected:
    void SetUp() override {
        ProgramTest::SetUp();
        PutState("site.db", Site("web"));
        store_ = At("store.db");
    }

    /// Two switches with settings that have fields in the store; `alias` is the alias of a port.
    static Buffer Site(std::string_view alias) {
        const std::vector<NewEntry> global = {
            MakeProperty("com.orbeno.common.alias", Text("production"), 0x10),
            MakeProperty("com.orbeno.common.version", Number(8), 0x10),
            MakeProperty("com.orbeno.etherswitch.mtu", Number(9000), 0x10)};
        const std::vector<NewEntry> other = {MakeProperty("com.orbeno.common.alias", Text("storage"), 0x10),
                                             MakeProperty("com.orbeno.common.version", Number(8), 0x10)};
        const std::vector<NewEntry> host = {
            MakeProperty("com.orbeno.common.host.portset", Text("DvsPortset-0"), 0x10)};
        const std::vector<NewEntry> ports = {
            MakeList("7", {MakeProperty("com.orbeno.common.port.alias", Text(alias), 0x10)})};
        return EncodeList(std::vector<NewEntry>{MakeSwitch("alpha", global, host, ports),
                                                MakeSwitch("beta", other, {}, {})});
    }

    /// Runs the program with the test's store as the default store.
    [[nodiscard]] Result Ctl(std::vector<std::string> args, std::vector<std::string> more = {}) const {
        more.push_back("DVS_CONFIGSTORE=" + store_);
        return RunProgram({.args = std::move(args), .environment = std::move(more)});
    }
    void Save() const {
        const Result saved = Ctl({"copy", At("site.db"), "store:"});
        ASSERT_EQ(saved.status, 0) << saved.err;
    }
    /// Saves again with another alias of the port.
    void SaveChange(std::string_view alias) const {
        PutState("changed.db", Site(alias));
        const Result saved = Ctl({"copy", At("changed.db"), "store:"});
        ASSERT_EQ(saved.status, 0) << saved.err;
    }
    [[nodiscard]] std::string Document(const std::string &name = "alpha") const {
        return Ctl({"store", "export", name}).out;
    }
    [[nodiscard]] std::int64_t Revision() const {
        return Json(Ctl({"store", "list", "--json"})).at("latest_revision").as_int64();
    }

    std::string store_;
};

} // namespace dvs::ctl::test

#endif
