/* SPDX-License-Identifier: Apache-2.0 */
// kernel: the live state of the switching module, read whole or as far as it is worth keeping, replaced as a
// whole.

#include "dvs/hyp.h"
#include "form/model.h"
#include "tools/dvsctl/kernel/device.h"
#include "tools/dvsctl/sources/schemes.h"

namespace dvs::ctl {

namespace {

class KernelSource : public Source {
public:
    KernelSource() : Source("kernel:") {}

    void CopiesTo(const Source &target) override { isForKeeping_ = target.KeepsPersistentState(); }

    std::optional<StateBytes> Read(Context &context, ReadMode) override {
        const bool persistent = context.options.persistent || isForKeeping_;
        const Answer answer =
            FetchFromDevice(context, persistent ? DVSHYP_PersistentStateGet : DVSHYP_StateGet);
        if (answer.IsDeviceAbsent() && context.options.ifExists) return std::nullopt;
        if (persistent && (answer.status == HYP_BAD_PARAM || answer.status == HYP_BAD_CHECKSUM))
            RefuseUnsound(context, answer);
        RequireOk(answer, "cannot read the switching module's state");
        return StateBytes{answer.bytes, {}};
    }

    std::vector<std::uint8_t> Plan(Context &context, Bytes state) override {
        RefuseSingle(context);
        return {state.begin(), state.end()};
    }

    void Write(Context &context, Bytes state) override {
        RefuseSingle(context);
        const Answer answer = CallDevice(context, [&](std::vector<std::uint8_t> &) {
            return DVSHYP_StateInit(state.data(), static_cast<std::uint32_t>(state.size()));
        });
        if (answer.status == HYP_OK) return;
        Error error = DeviceError(answer, "the switching module did not take the state");
        error.source = Name();
        // Replacing a state cannot meet something missing or double outside that state.
        if (answer.status == HYP_NOT_FOUND || answer.status == HYP_EXISTS) {
            error.kind = ErrorKind::Failed;
            error.why = answer.status == HYP_EXISTS
                            ? "a switch or port of the state is there twice"
                            : "a switch of the state lacks its version, class or port limit";
            error.next = "correct the state: dvsctl show lists it";
        }
        throw Error(error);
    }

    bool CountsWhenEmpty() const override { return false; }
    ErrorKind AbsentKind() const override { return ErrorKind::NoDevice; }
    std::string WhyAbsent() const override { return "the switching module's device is not there"; }

private:
    // The module takes whole states only: a switch alone would end all others, live.
    void RefuseSingle(const Context &context) const {
        if (!context.options.switchId) return;
        throw Error(ErrorKind::Usage, "a copy into the switching module is of the whole state")
            .In(Name())
            .Because("with --switch the module would lose all its other switches")
            .Try("dvsctl kernel switch and kernel prop change single things");
    }

    // The library says only that the state does not load; the whole state says where.
    [[noreturn]] void RefuseUnsound(Context &context, const Answer &refusal) {
        const Answer whole = FetchFromDevice(context, DVSHYP_StateGet);
        if (whole.status == HYP_OK && state::VerifyState(whole.bytes).first)
            throw Error(DamageError(*this, state::VerifyState(whole.bytes)));
        throw Error(DeviceError(refusal, "cannot read the switching module's state"));
    }

    bool isForKeeping_ = false;
};

} // namespace

std::unique_ptr<Source> OpenKernelSource(std::string_view rest) {
    if (!rest.empty())
        throw Error(ErrorKind::Usage, "kernel: stands alone, there is one switching module")
            .In("kernel:" + std::string(rest))
            .Try("write kernel:, and --switch ID for one of its switches");
    return std::make_unique<KernelSource>();
}

} // namespace dvs::ctl
