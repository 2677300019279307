/* SPDX-License-Identifier: Apache-2.0 */
// Values as trees (typed_value.h): a property's converter is run over an object that no store has, and the
// tree is read from or written to that object.

#include "configstore/typed/typed_value.h"

#include <map>
#include <memory>

#include "configstore/converters/common.h"
#include "configstore/converters/health_check.h"
#include "configstore/converters/switch_version.h"
#include "configstore/converters/table.h"
#include "configstore/layouts/registry.h"
#include "configstore/layouts/walk.h"
#include "configstore/typed/own_form.h"
#include "configstore/typed/tree.h"
#include "dvsdata/growing_image.h"
#include "dvsdata/list_internal.h"
#include "dvsstate/versions.h"

namespace dvs::typed {
namespace {

constexpr uint32_t kAnyVersion = 9; // the format does not depend on it

// The converters' process-wide values as the property's own key calls for, and silence. Restored at the end.
class Surroundings {
public:
    Surroundings(std::string_view key, const Context &context) {
        dvsSwitchClass = key.find(".vswitch.") != std::string_view::npos ? 1 : 0;
        dvsWidePortRecords = state::HasWidePortRecords(context.version);
        dvsconfigstore_debug = -1;
    }
    ~Surroundings() {
        dvsSwitchClass = switchClass_;
        dvsWidePortRecords = wide_;
        dvsconfigstore_debug = debug_;
    }
    Surroundings(const Surroundings &) = delete;
    Surroundings &operator=(const Surroundings &) = delete;

private:
    uint32_t switchClass_ = dvsSwitchClass;
    bool wide_ = dvsWidePortRecords;
    int32_t debug_ = dvsconfigstore_debug;
};

struct ObjectDeleter {
    void operator()(configstore::Object *object) const { configstore::DestroyObject(object); }
};
// One property, the object it is converted through, and where in it the property's leaf is.
class Bench {
public:
    Bench(uint32_t propClass, std::string_view key, const Context &context)
        : surroundings_(key, context), propClass_(propClass), context_(context),
          row_(layout::FindProperty(propClass, key)) {
        if (!row_) return;
        const bool isPortPools = ConverterTypeOf(*row_) == ConverterType::kPortPools;
        // A port's pools have no form of their own: they are the switch's.
        type_ = layout::FindType(isPortPools ? ConverterType::kTrafficResources : ConverterTypeOf(*row_));
        converter_ = type_ ? convert::ConverterFor(type_->type) : nullptr;
        own_ = type_ ? OwnFormOf(type_->type) : nullptr;
        configstore::Object *object = nullptr;
        if (!converter_ ||
            configstore::CreateObject("switches", "network_vds", "qel", "typed", "{}", &object))
            return;
        root_.reset(object);
        leaf_ = isPortPools ? "traffic_resources" : row_->path[row_->depth - 1];
        if (GetSubObjectByPath(row_->path, row_->depth, object, &parent_, true)) parent_ = nullptr;
    }

    [[nodiscard]] bool IsMapped() const { return row_ && type_; }
    [[nodiscard]] bool IsReady() const { return parent_ != nullptr; }
    [[nodiscard]] const layout::TypeInfo &type() const { return *type_; }
    [[nodiscard]] const layout::Record &record() const {
        return dvsWidePortRecords ? *type_->wide : *type_->record;
    }
    [[nodiscard]] Place place() const {
        return {parent_, leaf_,
                type_->type == ConverterType::kHealthCheck ? convert::HealthCheckInstance(row_->key)
                                                           : nullptr};
    }

    int32_t Save(std::span<const uint8_t> value) {
        const convert::Context conversion = {.switchClass = dvsSwitchClass, .wideRecords = dvsWidePortRecords};
        const int32_t status =
            converter_->save({conversion, root_.get(), parent_, leaf_, value, row_->key, propClass_, row_->loadPropType});
        if (status == 0) CorrectNames(value);
        return status;
    }

    /// The tree of a value that has been saved.
    [[nodiscard]] Node Read(std::span<const uint8_t> value) const {
        Node tree = ReadTree(*type_->form, place());
        if (own_ && own_->complete) own_->complete(record(), value, *type_->form, &tree);
        return tree;
    }

    /// The bytes of a tree that the object holds. `found` tells an absent property from an empty one.
    int32_t Build(const Node &tree, std::vector<uint8_t> *bytes, bool *found, Flaw *flaw) {
        const int32_t status = Load(bytes, found);
        if (status || !own_) return status;
        *flaw = own_->encode(record(), tree, bytes);
        *found = !bytes->empty();
        return 0;
    }

private:
    int32_t Load(std::vector<uint8_t> *bytes, bool *found) {
        if (const int32_t status = DescribeSwitch()) return status;
        data::GrowingImage list;
        if (list.BeginBuffer() != HYP_OK) return convert::kFailed;
        convert::KnownFilters filters;
        const convert::Context conversion = {
            .switchClass = dvsSwitchClass, .wideRecords = dvsWidePortRecords, .filters = &filters};
        int32_t status = converter_->load({conversion, root_.get(), parent_, &list, leaf_, row_->key,
                                           row_->loadPropType, propClass_});
        if (status == 0) status = static_cast<int32_t>(list.EndBuffer(kAnyVersion));
        data::InPlaceList entries;
        data::EntryRef entry;
        *found = status == 0 && entries.Open(list.Finished()) == HYP_OK && entries.Next(&entry);
        if (*found) bytes->assign(entry.value.begin(), entry.value.end());
        return status;
    }

    // Two saves write names that the load would not understand as they were meant. A tree has what a load
    // reads.
    void CorrectNames(std::span<const uint8_t> value) {
        configstore::Object *object = nullptr;
        if (type_->form->form != layout::Form::kObject) return;
        if (configstore::GetSubObject(parent_, leaf_, place().id, &object)) return;
        if (type_->record == &layout::kTeamingPolicy) {
            const layout::Domain &names = *layout::Find(layout::kTeamingPolicy, "policy")->domain;
            const char *name = convert::EnumText(layout::Texts(names), convert::GetU32(value, 0));
            if (name)
                (void)configstore::SetValueStr(object, "policy",
                                               name); // the name for another value stays at worst
        }
        if (type_->type == ConverterType::kHealthCheck) {
            (void)configstore::RemoveValue(object, "enable"); // a name that a tree does not show
            (void)configstore::SetValueBool(object, "enabled", value[0] != 0);
        }
    }

    // What the loads of some global properties ask the switch's object for.
    int32_t DescribeSwitch() {
        // The overlay flag is itself what the others ask for.
        if (propClass_ != DVS_PROP_CLASS_GLOBAL || type_->type == ConverterType::kOverlayFlag) return 0;
        int32_t status =
            configstore::SetValueBool(root_.get(), "ovl_enabled", state::IsOverlayVersion(context_.version));
        if (status || type_->type == ConverterType::kSwitchVersion) return status;
        configstore::Object *product = nullptr;
        status = GetOrCreateSubObject(true, root_.get(), "product", nullptr, &product);
        if (status) return status;
        // Class and version under which the property's key is the one that is loaded.
        status =
            configstore::SetValueStr(product, "forwarding_class", dvsSwitchClass ? "cswitch" : "etherswitch");
        if (status) return status;
        status = configstore::SetValueBool(root_.get(), "ovl_enabled", false);
        return status
                   ? status
                   : configstore::SetValueStr(product, "version", dvsWidePortRecords ? "OVL 1.0" : "6.0.0");
    }

    Surroundings surroundings_;
    uint32_t propClass_;
    Context context_;
    const DVSProp2ConfigEntry *row_;
    const layout::TypeInfo *type_ = nullptr;
    const convert::Converter *converter_ = nullptr;
    const OwnForm *own_ = nullptr;
    std::unique_ptr<configstore::Object, ObjectDeleter> root_;
    configstore::Object *parent_ = nullptr;
    const char *leaf_ = nullptr;
};

std::string ReasonOf(const layout::Record &record, std::span<const uint8_t> value, int32_t status) {
    const layout::Fault fault = layout::Check(record, value);
    if (fault.found) return "at byte " + std::to_string(fault.offset) + ": " + fault.what;
    return "its converter refuses it with status " + std::to_string(status);
}

// The fields of two values that differ, by the record.
std::vector<std::string> DifferencesOf(const layout::Record &record, std::span<const uint8_t> before,
                                       std::span<const uint8_t> after) {
    std::map<std::string, std::string> read;
    (void)layout::Walk(record, after,
                       [&](const layout::Item &item) { read[item.path] = layout::TextOf(item); });
    std::vector<std::string> differences;
    (void)layout::Walk(record, before, [&](const layout::Item &item) {
        const auto found = read.find(item.path);
        const std::string text = layout::TextOf(item);
        const std::string now = found == read.end() ? "absent" : found->second;
        if (text != now) differences.push_back(item.path + ": " + text + " becomes " + now);
    });
    if (differences.empty() && before.size() != after.size()) {
        differences.push_back("length: " + std::to_string(before.size()) + " becomes " +
                              std::to_string(after.size()));
    }
    if (differences.empty()) differences.emplace_back("bytes behind the end of a text");
    return differences;
}

void JudgeExactness(Bench *bench, std::span<const uint8_t> value, View *view) {
    std::vector<uint8_t> again;
    bool found = false;
    Flaw flaw;
    const int32_t status = bench->Build(view->tree, &again, &found, &flaw);
    if (!flaw) flaw = FindBrokenRule(*bench->type().form, view->tree);
    if (flaw) {
        view->differences.push_back(flaw.field + " " + flaw.reason);
    } else if (status) {
        view->differences.push_back("does not load again (status " + std::to_string(status) + ")");
    } else if (!found) {
        view->differences.emplace_back("loads as no property");
    } else if (std::equal(value.begin(), value.end(), again.begin(), again.end())) {
        view->exact = true;
    } else {
        view->differences = DifferencesOf(bench->record(), value, again);
    }
}

} // namespace

View Describe(uint32_t propClass, std::string_view key, std::span<const uint8_t> value,
              const Context &context, Ask ask) {
    View view;
    Context known = context;
    // A version's own number tells whether it is an overlay switch's.
    if (propClass == DVS_PROP_CLASS_GLOBAL && key == "com.orbeno.common.version" &&
        value.size() >= sizeof known.version) {
        known.version = convert::GetU32(value, 0);
    }
    Bench bench(propClass, key, known);
    if (!bench.IsMapped()) return view;
    view.state = State::kDamaged;
    if (!bench.IsReady()) {
        view.reason = "no memory to look into it";
        return view;
    }
    if (const int32_t status = bench.Save(value)) {
        view.reason = ReasonOf(bench.record(), value, status);
        return view;
    }
    Node tree = bench.Read(value);
    // Must not get to a load: of filters, such texts end the process there.
    if (const Flaw flaw = FindLongText(*bench.type().form, tree)) {
        view.reason = flaw.field + " " + flaw.reason;
        return view;
    }
    view.state = State::kTyped;
    view.tree = std::move(tree);
    view.summary = Summarize(bench.type().type, view.tree);
    if (ask == Ask::kChecked) JudgeExactness(&bench, value, &view);
    return view;
}

Built Build(uint32_t propClass, std::string_view key, const Node &tree, const Context &context, Ask ask) {
    Built built;
    {
        Bench bench(propClass, key, context);
        if (!bench.IsReady()) {
            built.reason = bench.IsMapped() ? "no memory to build it"
                                            : "the property has no typed form: its meaning is not known";
            return built;
        }
        const layout::StoreField &form = *bench.type().form;
        const Node normalized = Normalized(form, tree);
        Flaw flaw = WriteTree(form, bench.place(), normalized);
        bool found = false;
        const int32_t status = flaw ? 0 : bench.Build(normalized, &built.bytes, &found, &flaw);
        if (flaw) {
            built.field = flaw.field;
            built.reason = flaw.reason;
            return built;
        }
        if (status) {
            built.reason = std::string("is not complete, or not a value of this property; expected: ") +
                           form.meaning + " (status " + std::to_string(status) + ")";
            return built;
        }
        if (!found) {
            built.reason = "is what there is without the property; leave the property out";
            return built;
        }
        built.ok = true;
    }
    if (ask == Ask::kResult) return built;
    const View view = Describe(propClass, key, built.bytes, context, Ask::kResult);
    if (view.state != State::kTyped) {
        built.differences.push_back("the value reads back as damaged: " + view.reason);
    } else {
        const auto *type = layout::FindType(ConverterTypeOf(*layout::FindProperty(propClass, key)));
        built.differences = Compare(Normalized(*type->form, tree), view.tree);
    }
    return built;
}

} // namespace dvs::typed
