// One object instance: the record the host allocates for the module, the run header with the
// host's services, and the running of events with their checks.
#include <algorithm>
#include <map>
#include <stdexcept>

#include "guarded.h"
#include "internal.h"

namespace hv {

namespace {

using DataSizeEntry = short(WINAPI*)(Slot, Slot);
using CreateEntry = short(WINAPI*)(void* record, Slot, Slot);
using DestroyEntry = short(WINAPI*)(void* record, Slot);
using ConditionRoutine = int32_t(WINAPI*)(void* record, Slot, Slot);
using ActionRoutine = int16_t(WINAPI*)(void* record, Slot, Slot);
using ExpressionRoutine = Slot(WINAPI*)(void* record, Slot hostValue);

const uint16_t StringResultFlag = 0x8000;
// No module asks for more than this: a larger request is a fault, not a need.
const int LargestBuffer = 16 << 20;
// Where reading a text result that lies outside every host block gives up.
const size_t LongestText = 1 << 20;

// Records of live instances, so that a service can tell its caller's record from a stray address.
std::map<const void*, Instance*>& liveRecords() {
    static std::map<const void*, Instance*> records;
    return records;
}

// The instance whose event is running: services report misuse into its outcome.
Instance* running = nullptr;

// A text of at most `limit` UTF-16 units at an address that may be unaligned; `terminated` tells
// whether a zero ended it.
std::u16string readText(const uint8_t* p, size_t limit, bool* terminated) {
    size_t n = 0;
    while (n < limit && readAt<char16_t>(p, 2 * n)) ++n;
    *terminated = n < limit;
    std::u16string text(n, u'\0');
    std::memcpy(&text[0], p, 2 * n);
    return text;
}

}  // namespace

// What the host keeps while one event runs, and its lent buffers until the next event ends.
struct Instance::EventState {
    EventKind kind = EventKind::Condition;
    Outcome* outcome = nullptr;
    Slot hostValue = 0;
    std::vector<Slot> values;
    size_t nextParameter = 0;
    size_t nextExpressionParameter = 0;
    bool firstExpressionAsked = false;
    std::vector<Guarded> parameters;  // sealed: the module only reads them
    std::vector<Guarded> buffers;     // lent: the module writes inside them
    std::vector<uint8_t> headerBefore;

    void note(std::string what) {
        if (outcome) outcome->violations.push_back(std::move(what));
    }
    // The value of the next parameter, or 0 with a note when the event has no more.
    Slot take(size_t index, const char* service) {
        if (index < values.size()) return values[index];
        note(std::string(service) + " fetched parameter " + std::to_string(index + 1) +
             " of an event with " + std::to_string(values.size()));
        return 0;
    }
};

// The host services, as the module calls them through the run header.
struct Services {
    using EventState = Instance::EventState;

    // The instance whose record the module passed; misuse is noted against the running event.
    static Instance* owner(void* record, const char* service) {
        Instance* current = running;
        if (!current || !current->event_) return nullptr;
        Instance* found = nullptr;
        if (liveRecords().count(record))
            found = readAt<Instance*>(static_cast<const uint8_t*>(record), 0);
        if (found != current)
            current->event_->note(std::string(service) + " was given " +
                                  (found ? "another instance's record" : "no instance record"));
        return current;
    }

    static LPWSTR WINAPI getStringBuffer(void* record, int zero, int bytes) {
        Instance* self = owner(record, "GetStringBuffer");
        if (!self) return nullptr;
        EventState& e = *self->event_;
        if (zero != 0)
            e.note("GetStringBuffer: second argument " + std::to_string(zero) + ", not 0");
        if (bytes < 0 || bytes > LargestBuffer) {
            e.note("GetStringBuffer asked for " + std::to_string(bytes) + " bytes");
            return nullptr;
        }
        e.outcome->bufferRequests.push_back(static_cast<size_t>(bytes));
        if (self->lendNoBuffer_) return nullptr;
        std::string name = "lent buffer " + std::to_string(e.buffers.size() + 1) + " (" +
                           std::to_string(bytes) + " bytes)";
        e.buffers.emplace_back(name, static_cast<size_t>(bytes), Fill::Buffer);
        return reinterpret_cast<LPWSTR>(e.buffers.back().data());
    }

    // Both expression-parameter services take the same constant and the routine's host value.
    static Slot expressionParameter(void* record, int one, Slot hostValue, bool first) {
        std::string name = first ? "GetFirstExpressionParameter" : "GetNextExpressionParameter";
        Instance* self = owner(record, name.c_str());
        if (!self) return 0;
        EventState& e = *self->event_;
        ++e.outcome->expressionFetches;
        if (e.kind != EventKind::Expression) e.note(name + " called by " + withArticle(e.kind));
        if (one != 1) e.note(name + ": second argument " + std::to_string(one) + ", not 1");
        if (hostValue != e.hostValue)
            e.note(name + ": host value " + hex(static_cast<uint64_t>(hostValue)) +
                   ", not the expression's " + hex(static_cast<uint64_t>(e.hostValue)));
        if (first && e.firstExpressionAsked) e.note(name + " called again");
        if (!first && !e.firstExpressionAsked)
            e.note(name + " called before GetFirstExpressionParameter");
        e.firstExpressionAsked = true;
        if (first) e.nextExpressionParameter = 0;
        return e.take(e.nextExpressionParameter++, name.c_str());
    }

    static Slot WINAPI firstExpressionParameter(void* record, int one, Slot hostValue) {
        return expressionParameter(record, one, hostValue, true);
    }

    static Slot WINAPI nextExpressionParameter(void* record, int one, Slot hostValue) {
        return expressionParameter(record, one, hostValue, false);
    }

    static Slot WINAPI getNextParameter(void* record, int allBits, int zero) {
        Instance* self = owner(record, "GetNextParameter");
        if (!self) return 0;
        EventState& e = *self->event_;
        ++e.outcome->parameterFetches;
        if (e.kind == EventKind::Expression) e.note("GetNextParameter called by an expression");
        if (allBits != -1 || zero != 0)
            e.note("GetNextParameter: arguments " + std::to_string(allBits) + ", " +
                   std::to_string(zero) + ", not -1, 0");
        return e.take(e.nextParameter++, "GetNextParameter");
    }
};

Instance::Instance(Module& module) : module_(module) {
    auto dataSize = module.entry<DataSizeEntry>("GetRunObjectDataSize");
    auto create = module.entry<CreateEntry>("CreateRunObject");
    // An instance that could not be destroyed is refused before it is created.
    module.entry<DestroyEntry>("DestroyRunObject");
    recordSize_ = static_cast<uint16_t>(dataSize(0, 0));
    if (recordSize_ < BuildLayout.headerSize)
        throw std::runtime_error("GetRunObjectDataSize gave " + std::to_string(recordSize_) +
                                 " bytes, less than the host's own header");
    // The accessors read the module's fields at their offsets even if the module asked for
    // too little: those bytes then lie in the guard, inside the allocation.
    size_t guard = Fill::GuardSize + std::max(recordSize_, BuildLayout.recordSize) - recordSize_;
    block_ = std::make_unique<Guarded>("record", recordSize_, Fill::Record, guard);
    record_ = block_->data();
    layOutHeader();
    liveRecords()[record_] = this;
    create(record_, 0, 0);
    created_ = true;
}

Instance::~Instance() {
    if (created_) module_.entry<DestroyEntry>("DestroyRunObject")(record_, 0);
    liveRecords().erase(record_);
}

// Bytes 0 to 7 of the header hold the owning instance; byte 8 the run header.
void Instance::layOutHeader() {
    const HostLayout& l = BuildLayout;
    runHeader_.assign(l.runHeaderSize, Fill::RunHeader);
    writeAt(runHeader_.data(), l.getStringBuffer, &Services::getStringBuffer);
    writeAt(runHeader_.data(), l.getFirstExpressionParameter, &Services::firstExpressionParameter);
    writeAt(runHeader_.data(), l.getNextExpressionParameter, &Services::nextExpressionParameter);
    writeAt(runHeader_.data(), l.getNextParameter, &Services::getNextParameter);
    runHeaderSealed_ = runHeader_;
    writeAt(record_, 0, this);
    writeAt(record_, l.runHeader, static_cast<void*>(runHeader_.data()));
}

Outcome Instance::run(EventKind kind, int code, const std::vector<Param>& params) {
    Slot routine = routineAt(kind, code);
    Outcome outcome;
    beginEvent(kind, params, outcome);
    running = this;
    outcome.raw = call(kind, routine);
    running = nullptr;
    readResult(kind, outcome);
    checkSentinels(outcome);
    endEvent();
    return outcome;
}

// The previous event's blocks stay alive through this one: the module may be handed its text.
void Instance::beginEvent(EventKind kind, const std::vector<Param>& params, Outcome& outcome) {
    previous_ = std::move(event_);
    event_ = std::make_unique<EventState>();
    EventState& e = *event_;
    e.kind = kind;
    e.outcome = &outcome;
    e.hostValue = static_cast<Slot>(0x48560000u | (++events_ & 0xFFFFu));
    for (const Param& p : params) e.values.push_back(prepareParameter(p));
    // A flag left from an earlier event must not pass for this one's.
    setHeaderFlags(headerFlags() & ~StringResultFlag);
    e.headerBefore.assign(record_, record_ + BuildLayout.headerSize);
}

// From now on the event's blocks are the host's: any later write into them is damage.
void Instance::endEvent() {
    previous_.reset();
    event_->outcome = nullptr;
    for (Guarded& g : event_->parameters) g.retire("previous event's ");
    for (Guarded& g : event_->buffers) g.retire("previous event's ");
}

// The routine with this code from the module's tables; throws when there is none.
Slot Instance::routineAt(EventKind kind, int code) const {
    const Module::Tables& t = module_.tables();
    const std::vector<Slot>& table = kind == EventKind::Condition ? t.conditions
                                     : kind == EventKind::Action  ? t.actions
                                                                  : t.expressions;
    if (code < 0 || static_cast<size_t>(code) >= table.size() || !table[static_cast<size_t>(code)])
        throw std::out_of_range(std::string("the module has no ") + kindName(kind) + " " +
                                std::to_string(code));
    return table[static_cast<size_t>(code)];
}

// The slot value of a parameter; texts and root keys live in sealed host blocks for the event.
Slot Instance::prepareParameter(const Param& param) {
    EventState& e = *event_;
    std::string number = std::to_string(e.values.size() + 1);
    switch (param.kind) {
        case Param::Kind::Integer: return static_cast<Slot>(param.integer);
        case Param::Kind::Address: return param.address;
        case Param::Kind::Text: {
            size_t bytes = (param.text.size() + 1) * sizeof(char16_t);
            e.parameters.emplace_back("text of parameter " + number, bytes, 0);
            std::memcpy(e.parameters.back().data(), param.text.c_str(), bytes);
            break;
        }
        case Param::Kind::RootKey: {
            std::vector<uint8_t> bytes = rootKeyRecord(param.rootIndex);
            e.parameters.emplace_back("RootKeyParam of parameter " + number, bytes.size(), 0);
            std::memcpy(e.parameters.back().data(), bytes.data(), bytes.size());
            break;
        }
        default: return 0;
    }
    e.parameters.back().seal();
    return reinterpret_cast<Slot>(e.parameters.back().data());
}

// Calls a routine in its kind's shape: the record and two parameter values, or the record and
// the expression's host value.
Slot Instance::call(EventKind kind, Slot routine) {
    const std::vector<Slot>& v = event_->values;
    Slot first = v.size() > 0 ? v[0] : 0;
    Slot second = v.size() > 1 ? v[1] : 0;
    void* address = reinterpret_cast<void*>(routine);
    switch (kind) {
        case EventKind::Condition:
            return reinterpret_cast<ConditionRoutine>(address)(record_, first, second);
        case EventKind::Action:
            return reinterpret_cast<ActionRoutine>(address)(record_, first, second);
        default: return reinterpret_cast<ExpressionRoutine>(address)(record_, event_->hostValue);
    }
}

// A text result is read only as far as the host block it lies in.
void Instance::readResult(EventKind kind, Outcome& outcome) {
    bool flagged = (headerFlags() & StringResultFlag) != 0;
    if (kind != EventKind::Expression) {
        if (flagged) event_->note(withArticle(kind) + " set StringResultFlag");
        return;
    }
    if (!flagged) return;
    outcome.isText = true;
    outcome.textAddress = reinterpret_cast<const void*>(outcome.raw);
    const auto* p = static_cast<const uint8_t*>(outcome.textAddress);
    if (!p) {
        event_->note("the text result is a null address");
        return;
    }
    bool terminated = false;
    outcome.text = readText(p, locateText(p, outcome), &terminated);
    if (!terminated) event_->note("the text result has no terminator within its block");
}

// Where a text result lies, and how many characters can be read there.
size_t Instance::locateText(const uint8_t* p, Outcome& outcome) const {
    bool own = p == reinterpret_cast<const uint8_t*>(currentKey());
    outcome.textSource = own ? Outcome::TextSource::CurrentKey : Outcome::TextSource::Elsewhere;
    for (const EventState* state : {event_.get(), previous_.get()}) {
        if (!state) continue;
        for (const Guarded& b : state->buffers) {
            if (!b.contains(p)) continue;
            outcome.textSource = Outcome::TextSource::LentBuffer;
            return static_cast<size_t>(b.data() + b.size() - p) / sizeof(char16_t);
        }
    }
    return LongestText;
}

// Every block the module could have written where it must not, this event's and the last one's:
// the guards around the record first, then the header bytes the module must leave alone.
void Instance::checkSentinels(Outcome& outcome) {
    std::vector<std::string> damage;
    std::string record = block_->damage();
    if (record.empty()) record = damageToHeader();
    if (!record.empty()) damage.push_back(record);
    long changed = firstDifference(runHeader_.data(), runHeaderSealed_.data(), runHeader_.size());
    if (changed >= 0)
        damage.push_back("run header: byte " + std::to_string(changed) + " was written");
    for (EventState* state : {event_.get(), previous_.get()}) {
        if (!state) continue;
        for (const Guarded& g : state->parameters)
            if (!g.damage().empty()) damage.push_back(g.damage());
        for (const Guarded& g : state->buffers)
            if (!g.damage().empty()) damage.push_back(g.damage());
    }
    outcome.sentinelsIntact = damage.empty();
    for (const std::string& d : damage) outcome.damage += (outcome.damage.empty() ? "" : "; ") + d;
}

// Header bytes compared with their state before the event; of the header flags, the module may
// only set StringResultFlag.
std::string Instance::damageToHeader() const {
    const std::vector<uint8_t>& was = event_->headerBefore;
    size_t flags = BuildLayout.headerFlags, rest = flags + sizeof(uint16_t);
    long changed = firstDifference(record_, was.data(), flags);
    if (changed < 0) {
        changed = firstDifference(record_ + rest, was.data() + rest, was.size() - rest);
        if (changed >= 0) changed += static_cast<long>(rest);
    }
    if (changed >= 0) return "record header: byte " + std::to_string(changed) + " was written";
    uint16_t cleared = readAt<uint16_t>(was.data(), flags) & ~headerFlags();
    if (cleared) return "record header: headerFlags bits " + hex(cleared) + " were cleared";
    return std::string();
}

}  // namespace hv
