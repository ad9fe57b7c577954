// The encapsulated CMPI types the host hands to providers, their arenas and clones.
#include <cstddef>
#include <cstring>
#include <ctime>
#include <sys/time.h>

#include "Internal.h"

namespace ipif {
namespace detail {

// ---- Objects, arenas, frames, clones ---------------------------------------------------------

EncObject::EncObject(HostImpl* h) : host(h) { ++host->liveObjects; }
EncObject::~EncObject() { --host->liveObjects; }

StringObj::StringObj(HostImpl* h, std::string s) : CMPIString(), EncObject(h), text(std::move(s)) {
    hdl = &text[0];
    ft = &stringFT;
}
InstanceObj::InstanceObj(HostImpl* h, Instance i)
    : CMPIInstance(), EncObject(h), inst(std::move(i)), resolved(h->repo.resolved(inst.path.className)) {
    hdl = static_cast<EncObject*>(this);
    ft = &instanceFT;
}
PathObj::PathObj(HostImpl* h, ObjectPath p) : CMPIObjectPath(), EncObject(h), path(std::move(p)) {
    hdl = static_cast<EncObject*>(this);
    ft = &objectPathFT;
}
ArgsObj::ArgsObj(HostImpl* h, Args a) : CMPIArgs(), EncObject(h), args(std::move(a)) {
    hdl = static_cast<EncObject*>(this);
    ft = &argsFT;
}
ArrayObj::ArrayObj(HostImpl* h, CimType t, std::vector<Element> e)
    : CMPIArray(), EncObject(h), type(t), elements(std::move(e)) {
    hdl = static_cast<EncObject*>(this);
    ft = &arrayFT;
}
EnumObj::EnumObj(HostImpl* h, std::vector<Value> v) : CMPIEnumeration(), EncObject(h), items(std::move(v)) {
    hdl = static_cast<EncObject*>(this);
    ft = &enumerationFT;
}
DateTimeObj::DateTimeObj(HostImpl* h, std::string t, CMPIUint64 b, bool i)
    : CMPIDateTime(), EncObject(h), text(std::move(t)), binary(b), interval(i) {
    hdl = static_cast<EncObject*>(this);
    ft = &dateTimeFT;
}
ContextObj::ContextObj(HostImpl* h, NamedValues e) : CMPIContext(), EncObject(h), entries(std::move(e)) {
    hdl = static_cast<EncObject*>(this);
    ft = &contextFT;
}
ResultObj::ResultObj(HostImpl* h, Collector* c) : CMPIResult(), EncObject(h), sink(c) {
    hdl = static_cast<EncObject*>(this);
    ft = &resultFT;
}

Arena::~Arena() { clear(); }

std::size_t Arena::mark() {
    std::lock_guard<std::mutex> lock(mutex_);
    return objects_.size();
}

void Arena::releaseTo(std::size_t mark) {
    std::vector<std::unique_ptr<EncObject>> victims;
    {
        std::lock_guard<std::mutex> lock(mutex_);
        while (objects_.size() > mark) {
            victims.push_back(std::move(objects_.back()));
            objects_.pop_back();
        }
    }
    // victims go newest first, as they were pushed
}

void* Arena::allocate(std::size_t size, bool zero) {
    void* p = zero ? std::calloc(1, size ? size : 1) : std::malloc(size ? size : 1);
    if (!p) return nullptr;
    std::lock_guard<std::mutex> lock(mutex_);
    blocks_[p] = size;
    return p;
}

void* Arena::reallocate(void* block, std::size_t size) {
    if (!block) return allocate(size, false);
    std::lock_guard<std::mutex> lock(mutex_);
    auto it = blocks_.find(block);
    if (it == blocks_.end()) return nullptr;
    void* p = std::realloc(block, size ? size : 1);
    if (!p) return nullptr;
    blocks_.erase(it);
    blocks_[p] = size;
    return p;
}

bool Arena::free(void* block) {
    std::lock_guard<std::mutex> lock(mutex_);
    auto it = blocks_.find(block);
    if (it == blocks_.end()) return false;
    std::free(block);
    blocks_.erase(it);
    return true;
}

void Arena::clear() {
    std::vector<std::unique_ptr<EncObject>> victims;
    std::unordered_map<void*, std::size_t> blocks;
    {
        std::lock_guard<std::mutex> lock(mutex_);
        victims.swap(objects_);
        blocks.swap(blocks_);
    }
    while (!victims.empty()) victims.pop_back();
    for (auto& b : blocks) std::free(b.first);
}

Frame*& currentFrame() {
    thread_local Frame* frame = nullptr;
    return frame;
}

RequestScope::RequestScope(HostImpl* host) {
    Frame*& cur = currentFrame();
    if (cur && cur->host == host) {
        frame_ = cur;
        ++frame_->depth;
        return;
    }
    own_ = std::make_unique<Frame>();
    own_->host = host;
    own_->depth = 1;
    own_->previous = cur;
    frame_ = own_.get();
    cur = frame_;
}

RequestScope::~RequestScope() {
    if (own_) {
        currentFrame() = own_->previous;
        own_.reset();
    } else {
        --frame_->depth;
    }
}

bool RequestScope::tooDeep() const { return frame_->depth > 64; }

namespace clones {
namespace {
struct Registry {
    std::mutex mutex;
    std::unordered_map<const void*, std::unique_ptr<EncObject>> objects;
};
Registry& registry() {
    static Registry* r = new Registry;  // outlives every Host, also static ones
    return *r;
}
}  // namespace

void adopt(const void* key, std::unique_ptr<EncObject> obj) {
    HostImpl* h = obj->host;
    Registry& r = registry();
    std::lock_guard<std::mutex> lock(r.mutex);
    r.objects[key] = std::move(obj);
    ++h->liveClones;
}

bool release(const void* key) {
    std::unique_ptr<EncObject> victim;
    {
        Registry& r = registry();
        std::lock_guard<std::mutex> lock(r.mutex);
        auto it = r.objects.find(key);
        if (it == r.objects.end()) return false;
        victim = std::move(it->second);
        r.objects.erase(it);
    }
    --victim->host->liveClones;
    return true;
}

void releaseAll(HostImpl* host) {
    std::vector<std::unique_ptr<EncObject>> victims;
    {
        Registry& r = registry();
        std::lock_guard<std::mutex> lock(r.mutex);
        for (auto it = r.objects.begin(); it != r.objects.end();) {
            if (it->second->host == host) {
                victims.push_back(std::move(it->second));
                it = r.objects.erase(it);
            } else {
                ++it;
            }
        }
    }
    host->liveClones -= static_cast<long>(victims.size());
}
}  // namespace clones

// ---- Checked views -------------------------------------------------------------------------

StringObj* asString(const CMPIString* s) {
    return s && s->ft == &stringFT ? static_cast<StringObj*>(const_cast<CMPIString*>(s)) : nullptr;
}
InstanceObj* asInstance(const CMPIInstance* i) {
    return i && i->ft == &instanceFT ? static_cast<InstanceObj*>(const_cast<CMPIInstance*>(i)) : nullptr;
}
PathObj* asPath(const CMPIObjectPath* p) {
    return p && p->ft == &objectPathFT ? static_cast<PathObj*>(const_cast<CMPIObjectPath*>(p)) : nullptr;
}
ArgsObj* asArgs(const CMPIArgs* a) {
    return a && a->ft == &argsFT ? static_cast<ArgsObj*>(const_cast<CMPIArgs*>(a)) : nullptr;
}
ArrayObj* asArray(const CMPIArray* a) {
    return a && a->ft == &arrayFT ? static_cast<ArrayObj*>(const_cast<CMPIArray*>(a)) : nullptr;
}
DateTimeObj* asDateTime(const CMPIDateTime* d) {
    return d && d->ft == &dateTimeFT ? static_cast<DateTimeObj*>(const_cast<CMPIDateTime*>(d)) : nullptr;
}
ContextObj* asContext(const CMPIContext* c) {
    return c && c->ft == &contextFT ? static_cast<ContextObj*>(const_cast<CMPIContext*>(c)) : nullptr;
}
HostImpl* hostOf(const CMPIBroker* b) {
    return b && b->bft == &brokerFT && b->hdl ? static_cast<HostImpl*>(b->hdl) : nullptr;
}

// ---- Types and values ----------------------------------------------------------------------

CMPIType cmpiTypeOf(CimType t, bool array) {
    CMPIType base = CMPI_string;
    switch (t) {
    case CimType::Boolean: base = CMPI_boolean; break;
    case CimType::Char16: base = CMPI_char16; break;
    case CimType::Uint8: base = CMPI_uint8; break;
    case CimType::Uint16: base = CMPI_uint16; break;
    case CimType::Uint32: base = CMPI_uint32; break;
    case CimType::Uint64: base = CMPI_uint64; break;
    case CimType::Sint8: base = CMPI_sint8; break;
    case CimType::Sint16: base = CMPI_sint16; break;
    case CimType::Sint32: base = CMPI_sint32; break;
    case CimType::Sint64: base = CMPI_sint64; break;
    case CimType::Real32: base = CMPI_real32; break;
    case CimType::Real64: base = CMPI_real64; break;
    case CimType::String: base = CMPI_string; break;
    case CimType::DateTime: base = CMPI_dateTime; break;
    case CimType::Reference: base = CMPI_ref; break;
    case CimType::Instance: base = CMPI_instance; break;
    }
    return static_cast<CMPIType>(array ? (base | CMPI_ARRAY) : base);
}

bool cimTypeOf(CMPIType t, CimType& out, bool& array) {
    array = (t & CMPI_ARRAY) != 0;
    switch (static_cast<CMPIType>(t & ~CMPI_ARRAY)) {
    case CMPI_boolean: out = CimType::Boolean; return true;
    case CMPI_char16: out = CimType::Char16; return true;
    case CMPI_uint8: out = CimType::Uint8; return true;
    case CMPI_uint16: out = CimType::Uint16; return true;
    case CMPI_uint32: out = CimType::Uint32; return true;
    case CMPI_uint64: out = CimType::Uint64; return true;
    case CMPI_sint8: out = CimType::Sint8; return true;
    case CMPI_sint16: out = CimType::Sint16; return true;
    case CMPI_sint32: out = CimType::Sint32; return true;
    case CMPI_sint64: out = CimType::Sint64; return true;
    case CMPI_real32: out = CimType::Real32; return true;
    case CMPI_real64: out = CimType::Real64; return true;
    case CMPI_string:
    case CMPI_chars:
    case CMPI_charsptr: out = CimType::String; return true;
    case CMPI_dateTime: out = CimType::DateTime; return true;
    case CMPI_ref: out = CimType::Reference; return true;
    case CMPI_instance: out = CimType::Instance; return true;
    default: return false;
    }
}

namespace {

CMPIrc readScalar(const CMPIValue* v, CMPIType base, Element& e) {
    switch (base) {
    case CMPI_boolean: e = v->boolean != 0; return CMPI_RC_OK;
    case CMPI_char16: e = std::uint64_t(v->char16); return CMPI_RC_OK;
    case CMPI_uint8: e = std::uint64_t(v->uint8); return CMPI_RC_OK;
    case CMPI_uint16: e = std::uint64_t(v->uint16); return CMPI_RC_OK;
    case CMPI_uint32: e = std::uint64_t(v->uint32); return CMPI_RC_OK;
    case CMPI_uint64: e = std::uint64_t(v->uint64); return CMPI_RC_OK;
    case CMPI_sint8: e = std::int64_t(v->sint8); return CMPI_RC_OK;
    case CMPI_sint16: e = std::int64_t(v->sint16); return CMPI_RC_OK;
    case CMPI_sint32: e = std::int64_t(v->sint32); return CMPI_RC_OK;
    case CMPI_sint64: e = std::int64_t(v->sint64); return CMPI_RC_OK;
    case CMPI_real32: e = double(v->real32); return CMPI_RC_OK;
    case CMPI_real64: e = double(v->real64); return CMPI_RC_OK;
    case CMPI_chars:
        e.emplace<std::string>(reinterpret_cast<const char*>(v));
        return CMPI_RC_OK;
    case CMPI_charsptr:
        if (v->chars) e = std::string(v->chars);
        else e = std::monostate{};
        return CMPI_RC_OK;
    case CMPI_string: {
        if (!v->string) {
            e = std::monostate{};
            return CMPI_RC_OK;
        }
        StringObj* s = asString(v->string);
        if (!s) return CMPI_RC_ERR_INVALID_HANDLE;
        e = s->text;
        return CMPI_RC_OK;
    }
    case CMPI_dateTime: {
        if (!v->dateTime) {
            e = std::monostate{};
            return CMPI_RC_OK;
        }
        DateTimeObj* d = asDateTime(v->dateTime);
        if (!d) return CMPI_RC_ERR_INVALID_HANDLE;
        e = d->text;
        return CMPI_RC_OK;
    }
    case CMPI_ref: {
        if (!v->ref) {
            e = std::monostate{};
            return CMPI_RC_OK;
        }
        PathObj* p = asPath(v->ref);
        if (!p) return CMPI_RC_ERR_INVALID_HANDLE;
        e = std::make_shared<const ObjectPath>(p->path);
        return CMPI_RC_OK;
    }
    case CMPI_instance: {
        if (!v->inst) {
            e = std::monostate{};
            return CMPI_RC_OK;
        }
        InstanceObj* i = asInstance(v->inst);
        if (!i) return CMPI_RC_ERR_INVALID_HANDLE;
        e = std::make_shared<const Instance>(i->inst);
        return CMPI_RC_OK;
    }
    default: return CMPI_RC_ERR_INVALID_DATA_TYPE;
    }
}

void fillValue(HostImpl* host, Arena& arena, CimType t, const Element& e, CMPIValue& out) {
    switch (t) {
    case CimType::Boolean: out.boolean = std::get<bool>(e) ? 1 : 0; break;
    case CimType::Char16: out.char16 = static_cast<CMPIChar16>(std::get<std::uint64_t>(e)); break;
    case CimType::Uint8: out.uint8 = static_cast<CMPIUint8>(std::get<std::uint64_t>(e)); break;
    case CimType::Uint16: out.uint16 = static_cast<CMPIUint16>(std::get<std::uint64_t>(e)); break;
    case CimType::Uint32: out.uint32 = static_cast<CMPIUint32>(std::get<std::uint64_t>(e)); break;
    case CimType::Uint64: out.uint64 = std::get<std::uint64_t>(e); break;
    case CimType::Sint8: out.sint8 = static_cast<CMPISint8>(std::get<std::int64_t>(e)); break;
    case CimType::Sint16: out.sint16 = static_cast<CMPISint16>(std::get<std::int64_t>(e)); break;
    case CimType::Sint32: out.sint32 = static_cast<CMPISint32>(std::get<std::int64_t>(e)); break;
    case CimType::Sint64: out.sint64 = std::get<std::int64_t>(e); break;
    case CimType::Real32: out.real32 = static_cast<CMPIReal32>(std::get<double>(e)); break;
    case CimType::Real64: out.real64 = std::get<double>(e); break;
    case CimType::String: out.string = makeIn<StringObj>(arena, host, std::get<std::string>(e)); break;
    case CimType::DateTime: {
        const std::string& text = std::get<std::string>(e);
        CMPIUint64 bin = 0;
        bool interval = text.size() == 25 && text[21] == ':';
        dateTimeFromText(text, bin, interval);
        out.dateTime = makeIn<DateTimeObj>(arena, host, text, bin, interval);
        break;
    }
    case CimType::Reference: out.ref = makeIn<PathObj>(arena, host, *std::get<ObjectPathPtr>(e)); break;
    case CimType::Instance: out.inst = makeIn<InstanceObj>(arena, host, *std::get<InstancePtr>(e)); break;
    }
}

}  // namespace

CMPIrc readValue(const CMPIValue* value, CMPIType type, Value& out) {
    CimType ct;
    bool array = false;
    if (!cimTypeOf(type, ct, array)) return CMPI_RC_ERR_INVALID_DATA_TYPE;
    if (!value) {
        out = Value::null(ct, array);
        return CMPI_RC_OK;
    }
    if (array) {
        if (!value->array) {
            out = Value::null(ct, true);
            return CMPI_RC_OK;
        }
        ArrayObj* a = asArray(value->array);
        if (!a) return CMPI_RC_ERR_INVALID_HANDLE;
        if (a->type != ct) return CMPI_RC_ERR_TYPE_MISMATCH;
        out = Value::array(a->type, a->elements);
        return CMPI_RC_OK;
    }
    Element e;
    CMPIrc rc = readScalar(value, type, e);
    if (rc != CMPI_RC_OK) return rc;
    out = Value::scalar(ct, std::move(e));
    return CMPI_RC_OK;
}

CMPIData nullData(CMPIValueState state) {
    CMPIData d;
    std::memset(&d, 0, sizeof d);
    d.type = CMPI_null;
    d.state = state;
    return d;
}

CMPIData makeData(HostImpl* host, const Value& v, CMPIValueState extraState, Arena* arena) {
    Arena& a = arena ? *arena : host->arena();
    CMPIData d;
    std::memset(&d, 0, sizeof d);
    d.type = cmpiTypeOf(v.type(), v.isArray());
    d.state = extraState;
    if (v.isNull() || (!v.isArray() && v.elements().empty())) {
        d.state = static_cast<CMPIValueState>(d.state | CMPI_nullValue);
        return d;
    }
    if (v.isArray()) {
        d.value.array = makeIn<ArrayObj>(a, host, v.type(), v.elements().vector());
        return d;
    }
    fillValue(host, a, v.type(), v.elements()[0], d.value);
    return d;
}

CMPIStatus rcStatus(CMPIrc rc) {
    CMPIStatus s;
    s.rc = rc;
    s.msg = nullptr;
    return s;
}

CMPIStatus okStatus() { return rcStatus(CMPI_RC_OK); }

CMPIStatus status(HostImpl* host, CMPIrc rc, const std::string& message, Arena* arena) {
    CMPIStatus s = rcStatus(rc);
    if (host && !message.empty()) {
        try {
            s.msg = makeIn<StringObj>(arena ? *arena : host->arena(), host, message);
        } catch (...) {
        }
    }
    return s;
}

void setStatus(CMPIStatus* st, CMPIrc rc) {
    if (st) *st = rcStatus(rc);
}

void setStatus(CMPIStatus* st, HostImpl* host, CMPIrc rc, const std::string& message, Arena* arena) {
    if (st) *st = status(host, rc, message, arena);
}

std::string statusText(const CMPIStatus& st) {
    if (!st.msg) return "";
    if (StringObj* s = asString(st.msg)) return s->text;
    if (st.msg->ft && st.msg->ft->getCharPtr) {
        const char* c = st.msg->ft->getCharPtr(st.msg, nullptr);
        return c ? c : "";
    }
    return "";
}

// ---- Datetime ------------------------------------------------------------------------------

namespace {
bool digits(const std::string& s, std::size_t from, std::size_t n, unsigned long long& out) {
    out = 0;
    for (std::size_t i = from; i < from + n; ++i) {
        if (s[i] < '0' || s[i] > '9') return false;
        out = out * 10 + static_cast<unsigned>(s[i] - '0');
    }
    return true;
}
}  // namespace

bool dateTimeFromText(const std::string& s, CMPIUint64& binary, bool& interval) {
    if (s.size() != 25 || s[14] != '.') return false;
    char sign = s[21];
    unsigned long long micro, hh, mi, ss;
    if (!digits(s, 15, 6, micro) || !digits(s, 8, 2, hh) || !digits(s, 10, 2, mi) || !digits(s, 12, 2, ss))
        return false;
    if (hh > 23 || mi > 59 || ss > 60) return false;
    if (sign == ':') {
        unsigned long long days, zero;
        if (!digits(s, 0, 8, days) || !digits(s, 22, 3, zero)) return false;
        interval = true;
        binary = (((days * 24 + hh) * 60 + mi) * 60 + ss) * 1000000ULL + micro;
        return true;
    }
    if (sign != '+' && sign != '-') return false;
    unsigned long long year, month, day, offset;
    if (!digits(s, 0, 4, year) || !digits(s, 4, 2, month) || !digits(s, 6, 2, day) || !digits(s, 22, 3, offset))
        return false;
    if (month < 1 || month > 12 || day < 1 || day > 31) return false;
    struct tm tm {};
    tm.tm_year = static_cast<int>(year) - 1900;
    tm.tm_mon = static_cast<int>(month) - 1;
    tm.tm_mday = static_cast<int>(day);
    tm.tm_hour = static_cast<int>(hh);
    tm.tm_min = static_cast<int>(mi);
    tm.tm_sec = static_cast<int>(ss);
    long long local = static_cast<long long>(timegm(&tm));
    long long utc = local - (sign == '+' ? 1 : -1) * static_cast<long long>(offset) * 60;
    if (utc < 0) return false;
    interval = false;
    binary = static_cast<CMPIUint64>(utc) * 1000000ULL + micro;
    return true;
}

std::string dateTimeToText(CMPIUint64 binary, bool interval) {
    char buf[64];
    unsigned long long micro = binary % 1000000ULL;
    unsigned long long secs = binary / 1000000ULL;
    if (interval) {
        unsigned long long days = secs / 86400;
        if (days > 99999999ULL) days = 99999999ULL;
        std::snprintf(buf, sizeof buf, "%08llu%02llu%02llu%02llu.%06llu:000", days, (secs / 3600) % 24,
                      (secs / 60) % 60, secs % 60, micro);
        return buf;
    }
    time_t t = static_cast<time_t>(secs);
    struct tm tm {};
    gmtime_r(&t, &tm);
    std::snprintf(buf, sizeof buf, "%04d%02d%02d%02d%02d%02d.%06llu+000", (tm.tm_year + 1900) % 10000,
                  tm.tm_mon + 1, tm.tm_mday, tm.tm_hour, tm.tm_min, tm.tm_sec, micro);
    return buf;
}

CMPIUint64 nowMicroseconds() {
    struct timeval tv {};
    gettimeofday(&tv, nullptr);
    return static_cast<CMPIUint64>(tv.tv_sec) * 1000000ULL + static_cast<CMPIUint64>(tv.tv_usec);
}

// ---- Function tables -----------------------------------------------------------------------

namespace {

template <class O, class C>
O* self(const C* c) {
    return static_cast<O*>(const_cast<C*>(c));
}

// Runs f, turning any exception into CMPI_RC_ERR_FAILED so none crosses into a provider.
template <class R, class F>
R guarded(CMPIStatus* rc, R fallback, F&& f) noexcept {
    try {
        return f();
    } catch (...) {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return fallback;
    }
}

template <class F>
CMPIStatus guardedStatus(F&& f) noexcept {
    try {
        return f();
    } catch (...) {
        return rcStatus(CMPI_RC_ERR_FAILED);
    }
}

CMPIStatus invalidHandle() { return rcStatus(CMPI_RC_ERR_INVALID_HANDLE); }

// release(): a clone goes at once; anything else belongs to its request or host.
template <class C>
CMPIStatus releaseAny(C* obj) {
    if (!obj) return invalidHandle();
    clones::release(obj);
    return okStatus();
}

CMPIData notFound(CMPIStatus* rc, CMPIrc code) {
    setStatus(rc, code);
    return nullData(static_cast<CMPIValueState>(CMPI_nullValue | CMPI_notFound));
}

// clone(): a copy the provider owns, of what each object holds.
StringObj* copyOf(StringObj* o) { return makeClone<StringObj>(o->host, o->text); }
InstanceObj* copyOf(InstanceObj* o) {
    InstanceObj* c = makeClone<InstanceObj>(o->host, o->inst);
    c->filtered = o->filtered;
    c->filter = o->filter;
    return c;
}
PathObj* copyOf(PathObj* o) {
    PathObj* c = makeClone<PathObj>(o->host, o->path);
    c->hostname = o->hostname;
    return c;
}
ArgsObj* copyOf(ArgsObj* o) { return makeClone<ArgsObj>(o->host, o->args); }
ArrayObj* copyOf(ArrayObj* o) { return makeClone<ArrayObj>(o->host, o->type, o->elements); }
EnumObj* copyOf(EnumObj* o) {
    EnumObj* c = makeClone<EnumObj>(o->host, o->items);
    c->next = o->next;
    return c;
}
DateTimeObj* copyOf(DateTimeObj* o) { return makeClone<DateTimeObj>(o->host, o->text, o->binary, o->interval); }
ContextObj* copyOf(ContextObj* o) { return makeClone<ContextObj>(o->host, o->entries); }

template <class O, class C = typename O::CmpiType>
C* cloneOf(const C* x, CMPIStatus* rc) {
    if (!x) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), nullptr;
    return guarded<C*>(rc, nullptr, [&] {
        O* c = copyOf(self<O>(x));
        setStatus(rc, CMPI_RC_OK);
        return static_cast<C*>(c);
    });
}

// --- String

char* strGetCharPtr(const CMPIString* s, CMPIStatus* rc) {
    if (!s) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), nullptr;
    setStatus(rc, CMPI_RC_OK);
    return static_cast<char*>(s->hdl);
}

// --- Instance

bool inFilter(const InstanceObj* o, std::string_view name) {
    if (!o->filtered) return true;
    for (const auto& f : o->filter)
        if (equalsIgnoreCase(f, name)) return true;
    return false;
}

CMPIData instGetProperty(const CMPIInstance* i, const char* name, CMPIStatus* rc) {
    if (!i || !name) return notFound(rc, i ? CMPI_RC_ERR_INVALID_PARAMETER : CMPI_RC_ERR_INVALID_HANDLE);
    return guarded<CMPIData>(rc, nullData(), [&] {
        InstanceObj* o = self<InstanceObj>(i);
        const Value* v = o->inst.properties.find(name);
        if (!v) return notFound(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        setStatus(rc, CMPI_RC_OK);
        return makeData(o->host, *v);
    });
}
CMPIData instGetPropertyAt(const CMPIInstance* i, CMPICount index, CMPIString** name, CMPIStatus* rc) {
    if (!i) return notFound(rc, CMPI_RC_ERR_INVALID_HANDLE);
    return guarded<CMPIData>(rc, nullData(), [&] {
        InstanceObj* o = self<InstanceObj>(i);
        if (index >= o->inst.properties.size()) return notFound(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        const auto& item = o->inst.properties.at(index);
        if (name) *name = make<StringObj>(o->host, item.first);
        setStatus(rc, CMPI_RC_OK);
        return makeData(o->host, item.second);
    });
}
CMPICount instGetPropertyCount(const CMPIInstance* i, CMPIStatus* rc) {
    if (!i) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), 0;
    setStatus(rc, CMPI_RC_OK);
    return static_cast<CMPICount>(self<InstanceObj>(i)->inst.properties.size());
}
CMPIStatus instSetProperty(const CMPIInstance* i, const char* name, const CMPIValue* value, CMPIType type) {
    if (!i) return invalidHandle();
    if (!name || !*name) return rcStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    return guardedStatus([&] {
        InstanceObj* o = self<InstanceObj>(i);
        Value v;
        CMPIrc r = readValue(value, type, v);
        if (r != CMPI_RC_OK) return rcStatus(r);
        HostImpl* h = o->host;
        const std::string& cls = o->inst.path.className;
        const PropertyDecl* decl = h->repo.property(o->resolved, name);
        // A declared property implies a known class: the class is looked up again only when not.
        if (h->options.strictProperties && (decl || h->repo.exists(cls))) {
            if (!decl) return status(h, CMPI_RC_ERR_NO_SUCH_PROPERTY, "class " + cls + " has no property " + name);
            if (decl->type != v.type() || decl->array != v.isArray())
                return status(h, CMPI_RC_ERR_TYPE_MISMATCH,
                              std::string("property ") + name + " is declared " + typeName(decl->type) +
                                  (decl->array ? "[]" : ""));
        }
        if (!inFilter(o, name) && !(decl && decl->key)) return okStatus();
        const std::string_view n = decl ? std::string_view(decl->name) : std::string_view(name);
        if (decl && decl->key) {
            // Providers mostly set a key to the value their path already holds: no copy then.
            const Value* held = o->inst.path.keys.find(n);
            if (!held || *held != v) o->inst.path.keys.set(n, v);
        }
        o->inst.properties.set(n, std::move(v));
        return okStatus();
    });
}
CMPIStatus instSetPropertyWithOrigin(const CMPIInstance* i, const char* name, const CMPIValue* value,
                                     const CMPIType type, const char*) {
    return instSetProperty(i, name, value, type);
}
CMPIObjectPath* instGetObjectPath(const CMPIInstance* i, CMPIStatus* rc) {
    if (!i) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), nullptr;
    return guarded<CMPIObjectPath*>(rc, nullptr, [&] {
        InstanceObj* o = self<InstanceObj>(i);
        setStatus(rc, CMPI_RC_OK);
        return static_cast<CMPIObjectPath*>(make<PathObj>(o->host, o->inst.path));
    });
}
CMPIStatus instSetPropertyFilter(CMPIInstance* i, const char** props, const char**) {
    if (!i) return invalidHandle();
    return guardedStatus([&] {
        InstanceObj* o = self<InstanceObj>(i);
        if (!props) {
            o->filtered = false;
            o->filter.clear();
            return okStatus();
        }
        o->filtered = true;
        o->filter.clear();
        for (const char** p = props; *p; ++p) o->filter.emplace_back(*p);
        NamedValues kept;
        for (const auto& item : o->inst.properties) {
            const PropertyDecl* decl = o->host->repo.property(o->inst.path.className, item.first);
            if (inFilter(o, item.first) || (decl && decl->key)) kept.set(item.first, item.second);
        }
        o->inst.properties = std::move(kept);
        return okStatus();
    });
}
CMPIStatus instSetObjectPath(CMPIInstance* i, const CMPIObjectPath* op) {
    if (!i) return invalidHandle();
    PathObj* p = asPath(op);
    if (!p) return rcStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    return guardedStatus([&] {
        InstanceObj* o = self<InstanceObj>(i);
        o->inst.path = p->path;
        o->resolved = o->host->repo.resolved(o->inst.path.className);
        return okStatus();
    });
}

// --- Object path

CMPIStatus pathSetNameSpace(CMPIObjectPath* p, const char* ns) {
    if (!p) return invalidHandle();
    return guardedStatus([&] {
        self<PathObj>(p)->path.nameSpace = ns ? ns : "";
        return okStatus();
    });
}
CMPIString* pathGetNameSpace(const CMPIObjectPath* p, CMPIStatus* rc) {
    if (!p) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), nullptr;
    return guarded<CMPIString*>(rc, nullptr, [&] {
        PathObj* o = self<PathObj>(p);
        setStatus(rc, CMPI_RC_OK);
        return static_cast<CMPIString*>(make<StringObj>(o->host, o->path.nameSpace));
    });
}
CMPIStatus pathSetHostname(CMPIObjectPath* p, const char* hn) {
    if (!p) return invalidHandle();
    return guardedStatus([&] {
        self<PathObj>(p)->hostname = hn ? hn : "";
        return okStatus();
    });
}
CMPIString* pathGetHostname(const CMPIObjectPath* p, CMPIStatus* rc) {
    if (!p) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), nullptr;
    return guarded<CMPIString*>(rc, nullptr, [&] {
        PathObj* o = self<PathObj>(p);
        setStatus(rc, CMPI_RC_OK);
        return static_cast<CMPIString*>(make<StringObj>(o->host, o->hostname));
    });
}
CMPIStatus pathSetClassName(CMPIObjectPath* p, const char* cn) {
    if (!p) return invalidHandle();
    return guardedStatus([&] {
        self<PathObj>(p)->path.className = cn ? cn : "";
        return okStatus();
    });
}
CMPIString* pathGetClassName(const CMPIObjectPath* p, CMPIStatus* rc) {
    if (!p) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), nullptr;
    return guarded<CMPIString*>(rc, nullptr, [&] {
        PathObj* o = self<PathObj>(p);
        setStatus(rc, CMPI_RC_OK);
        return static_cast<CMPIString*>(make<StringObj>(o->host, o->path.className));
    });
}
CMPIStatus pathAddKey(CMPIObjectPath* p, const char* name, const CMPIValue* value, const CMPIType type) {
    if (!p) return invalidHandle();
    if (!name || !*name) return rcStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    return guardedStatus([&] {
        Value v;
        CMPIrc r = readValue(value, type, v);
        if (r != CMPI_RC_OK) return rcStatus(r);
        self<PathObj>(p)->path.keys.set(name, std::move(v));
        return okStatus();
    });
}
CMPIData pathGetKey(const CMPIObjectPath* p, const char* name, CMPIStatus* rc) {
    if (!p || !name) return notFound(rc, p ? CMPI_RC_ERR_INVALID_PARAMETER : CMPI_RC_ERR_INVALID_HANDLE);
    return guarded<CMPIData>(rc, nullData(), [&] {
        PathObj* o = self<PathObj>(p);
        const Value* v = o->path.keys.find(name);
        if (!v) return notFound(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        setStatus(rc, CMPI_RC_OK);
        return makeData(o->host, *v, CMPI_keyValue);
    });
}
CMPIData pathGetKeyAt(const CMPIObjectPath* p, CMPICount index, CMPIString** name, CMPIStatus* rc) {
    if (!p) return notFound(rc, CMPI_RC_ERR_INVALID_HANDLE);
    return guarded<CMPIData>(rc, nullData(), [&] {
        PathObj* o = self<PathObj>(p);
        if (index >= o->path.keys.size()) return notFound(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        const auto& item = o->path.keys.at(index);
        if (name) *name = make<StringObj>(o->host, item.first);
        setStatus(rc, CMPI_RC_OK);
        return makeData(o->host, item.second, CMPI_keyValue);
    });
}
CMPICount pathGetKeyCount(const CMPIObjectPath* p, CMPIStatus* rc) {
    if (!p) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), 0;
    setStatus(rc, CMPI_RC_OK);
    return static_cast<CMPICount>(self<PathObj>(p)->path.keys.size());
}
CMPIStatus pathSetNameSpaceFromObjectPath(CMPIObjectPath* p, const CMPIObjectPath* src) {
    if (!p) return invalidHandle();
    PathObj* s = asPath(src);
    if (!s) return rcStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    return guardedStatus([&] {
        self<PathObj>(p)->path.nameSpace = s->path.nameSpace;
        return okStatus();
    });
}
CMPIStatus pathSetHostAndNameSpaceFromObjectPath(CMPIObjectPath* p, const CMPIObjectPath* src) {
    if (!p) return invalidHandle();
    PathObj* s = asPath(src);
    if (!s) return rcStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    return guardedStatus([&] {
        self<PathObj>(p)->path.nameSpace = s->path.nameSpace;
        self<PathObj>(p)->hostname = s->hostname;
        return okStatus();
    });
}

CMPIData qualifierData(HostImpl* h, const std::vector<Qualifier>& qs, const char* qName, CMPIStatus* rc) {
    for (const auto& q : qs) {
        if (!equalsIgnoreCase(q.name, qName)) continue;
        setStatus(rc, CMPI_RC_OK);
        if (equalsIgnoreCase(q.value, "true") || equalsIgnoreCase(q.value, "false"))
            return makeData(h, Value::boolean(equalsIgnoreCase(q.value, "true")));
        return makeData(h, Value::string(q.value));
    }
    return notFound(rc, CMPI_RC_ERR_NOT_FOUND);
}
CMPIData pathGetClassQualifier(const CMPIObjectPath* p, const char* q, CMPIStatus* rc) {
    if (!p || !q) return notFound(rc, p ? CMPI_RC_ERR_INVALID_PARAMETER : CMPI_RC_ERR_INVALID_HANDLE);
    return guarded<CMPIData>(rc, nullData(), [&] {
        PathObj* o = self<PathObj>(p);
        const ClassDecl* c = o->host->repo.find(o->path.className);
        if (!c) return notFound(rc, CMPI_RC_ERR_INVALID_CLASS);
        return qualifierData(o->host, c->qualifiers, q, rc);
    });
}
CMPIData pathGetPropertyQualifier(const CMPIObjectPath* p, const char* prop, const char* q, CMPIStatus* rc) {
    if (!p || !prop || !q) return notFound(rc, p ? CMPI_RC_ERR_INVALID_PARAMETER : CMPI_RC_ERR_INVALID_HANDLE);
    return guarded<CMPIData>(rc, nullData(), [&] {
        PathObj* o = self<PathObj>(p);
        const PropertyDecl* d = o->host->repo.property(o->path.className, prop);
        if (!d) return notFound(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        return qualifierData(o->host, d->qualifiers, q, rc);
    });
}
CMPIData pathGetMethodQualifier(const CMPIObjectPath* p, const char* m, const char* q, CMPIStatus* rc) {
    if (!p || !m || !q) return notFound(rc, p ? CMPI_RC_ERR_INVALID_PARAMETER : CMPI_RC_ERR_INVALID_HANDLE);
    return guarded<CMPIData>(rc, nullData(), [&] {
        PathObj* o = self<PathObj>(p);
        const MethodDecl* d = o->host->repo.method(o->path.className, m);
        if (!d) return notFound(rc, CMPI_RC_ERR_METHOD_NOT_FOUND);
        return qualifierData(o->host, d->qualifiers, q, rc);
    });
}
CMPIData pathGetParameterQualifier(const CMPIObjectPath* p, const char* m, const char* param, const char* q,
                                   CMPIStatus* rc) {
    if (!p || !m || !param || !q)
        return notFound(rc, p ? CMPI_RC_ERR_INVALID_PARAMETER : CMPI_RC_ERR_INVALID_HANDLE);
    return guarded<CMPIData>(rc, nullData(), [&] {
        PathObj* o = self<PathObj>(p);
        const MethodDecl* d = o->host->repo.method(o->path.className, m);
        if (!d) return notFound(rc, CMPI_RC_ERR_METHOD_NOT_FOUND);
        const ParameterDecl* pd = d->parameter(param);
        if (!pd) return notFound(rc, CMPI_RC_ERR_NOT_FOUND);
        return qualifierData(o->host, pd->qualifiers, q, rc);
    });
}
CMPIString* pathToString(const CMPIObjectPath* p, CMPIStatus* rc) {
    if (!p) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), nullptr;
    return guarded<CMPIString*>(rc, nullptr, [&] {
        PathObj* o = self<PathObj>(p);
        setStatus(rc, CMPI_RC_OK);
        return static_cast<CMPIString*>(make<StringObj>(o->host, o->path.toString()));
    });
}

// --- Named values: an Args' arguments and a context's entries work alike but for the rc of a
// name or index they lack.

template <class O, NamedValues O::*values, CMPIrc missing>
struct Named {
    using C = typename O::CmpiType;
    static CMPIStatus add(const C* c, const char* name, const CMPIValue* value, const CMPIType type) {
        if (!c) return invalidHandle();
        if (!name || !*name) return rcStatus(CMPI_RC_ERR_INVALID_PARAMETER);
        return guardedStatus([&] {
            Value v;
            CMPIrc r = readValue(value, type, v);
            if (r != CMPI_RC_OK) return rcStatus(r);
            (self<O>(c)->*values).set(name, std::move(v));
            return okStatus();
        });
    }
    static CMPIData get(const C* c, const char* name, CMPIStatus* rc) {
        if (!c || !name) return notFound(rc, c ? CMPI_RC_ERR_INVALID_PARAMETER : CMPI_RC_ERR_INVALID_HANDLE);
        return guarded<CMPIData>(rc, nullData(), [&] {
            O* o = self<O>(c);
            const Value* v = (o->*values).find(name);
            if (!v) return notFound(rc, missing);
            setStatus(rc, CMPI_RC_OK);
            return makeData(o->host, *v);
        });
    }
    static CMPIData getAt(const C* c, CMPICount index, CMPIString** name, CMPIStatus* rc) {
        if (!c) return notFound(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return guarded<CMPIData>(rc, nullData(), [&] {
            O* o = self<O>(c);
            if (index >= (o->*values).size()) return notFound(rc, missing);
            const auto& item = (o->*values).at(index);
            if (name) *name = make<StringObj>(o->host, item.first);
            setStatus(rc, CMPI_RC_OK);
            return makeData(o->host, item.second);
        });
    }
    static CMPICount count(const C* c, CMPIStatus* rc) {
        if (!c) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), 0;
        setStatus(rc, CMPI_RC_OK);
        return static_cast<CMPICount>((self<O>(c)->*values).size());
    }
    static std::string text(const void* object) {
        std::string out;
        for (const auto& a : static_cast<const O*>(static_cast<const C*>(object))->*values)
            out += a.first + " = " + a.second.toText() + ";\n";
        return out;
    }
};
using ArgsNamed = Named<ArgsObj, &ArgsObj::args, CMPI_RC_ERR_NOT_FOUND>;
using ContextNamed = Named<ContextObj, &ContextObj::entries, CMPI_RC_ERR_NO_SUCH_PROPERTY>;

// --- Array

CMPICount arrGetSize(const CMPIArray* a, CMPIStatus* rc) {
    if (!a) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), 0;
    setStatus(rc, CMPI_RC_OK);
    return static_cast<CMPICount>(self<ArrayObj>(a)->elements.size());
}
CMPIType arrGetSimpleType(const CMPIArray* a, CMPIStatus* rc) {
    if (!a) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), CMPIType(CMPI_null);
    setStatus(rc, CMPI_RC_OK);
    return cmpiTypeOf(self<ArrayObj>(a)->type, false);
}
CMPIData arrGetElementAt(const CMPIArray* a, CMPICount index, CMPIStatus* rc) {
    if (!a) return notFound(rc, CMPI_RC_ERR_INVALID_HANDLE);
    return guarded<CMPIData>(rc, nullData(), [&] {
        ArrayObj* o = self<ArrayObj>(a);
        if (index >= o->elements.size()) return notFound(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        setStatus(rc, CMPI_RC_OK);
        return makeData(o->host, Value::scalar(o->type, o->elements[index]));
    });
}
CMPIStatus arrSetElementAt(CMPIArray* a, CMPICount index, const CMPIValue* value, CMPIType type) {
    if (!a) return invalidHandle();
    return guardedStatus([&] {
        ArrayObj* o = self<ArrayObj>(a);
        if (index >= o->elements.size()) return rcStatus(CMPI_RC_ERR_NO_SUCH_PROPERTY);
        Value v;
        CMPIrc r = readValue(value, static_cast<CMPIType>(type & ~CMPI_ARRAY), v);
        if (r != CMPI_RC_OK) return rcStatus(r);
        if (v.type() != o->type) return rcStatus(CMPI_RC_ERR_TYPE_MISMATCH);
        o->elements[index] = v.isNull() ? Element() : v.elements()[0];
        return okStatus();
    });
}

// --- Enumeration

CMPIData enumGetNext(const CMPIEnumeration* e, CMPIStatus* rc) {
    if (!e) return notFound(rc, CMPI_RC_ERR_INVALID_HANDLE);
    return guarded<CMPIData>(rc, nullData(), [&] {
        EnumObj* o = self<EnumObj>(e);
        if (o->next >= o->items.size()) return notFound(rc, CMPI_RC_ERR_NOT_FOUND);
        setStatus(rc, CMPI_RC_OK);
        return makeData(o->host, o->items[o->next++]);
    });
}
CMPIBoolean enumHasNext(const CMPIEnumeration* e, CMPIStatus* rc) {
    if (!e) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), CMPIBoolean(0);
    setStatus(rc, CMPI_RC_OK);
    EnumObj* o = self<EnumObj>(e);
    return o->next < o->items.size() ? 1 : 0;
}
CMPIArray* enumToArray(const CMPIEnumeration* e, CMPIStatus* rc) {
    if (!e) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), nullptr;
    return guarded<CMPIArray*>(rc, nullptr, [&] {
        EnumObj* o = self<EnumObj>(e);
        CimType t = o->items.empty() ? CimType::Instance : o->items.front().type();
        std::vector<Element> elements;
        for (const auto& v : o->items) elements.push_back(v.isNull() ? Element() : v.elements()[0]);
        setStatus(rc, CMPI_RC_OK);
        return static_cast<CMPIArray*>(make<ArrayObj>(o->host, t, std::move(elements)));
    });
}

// --- Datetime

CMPIUint64 dtGetBinaryFormat(const CMPIDateTime* d, CMPIStatus* rc) {
    if (!d) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), CMPIUint64(0);
    setStatus(rc, CMPI_RC_OK);
    return self<DateTimeObj>(d)->binary;
}
CMPIString* dtGetStringFormat(const CMPIDateTime* d, CMPIStatus* rc) {
    if (!d) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), nullptr;
    return guarded<CMPIString*>(rc, nullptr, [&] {
        DateTimeObj* o = self<DateTimeObj>(d);
        setStatus(rc, CMPI_RC_OK);
        return static_cast<CMPIString*>(make<StringObj>(o->host, o->text));
    });
}
CMPIBoolean dtIsInterval(const CMPIDateTime* d, CMPIStatus* rc) {
    if (!d) return setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE), CMPIBoolean(0);
    setStatus(rc, CMPI_RC_OK);
    return self<DateTimeObj>(d)->interval ? 1 : 0;
}

// --- Result

Collector* sinkOf(const CMPIResult* r) { return self<ResultObj>(r)->sink; }
CMPIStatus closedResult(const CMPIResult* r) {
    return status(self<ResultObj>(r)->host, CMPI_RC_ERR_FAILED, "result used after its request returned");
}

CMPIResult* resClone(const CMPIResult* r, CMPIStatus* rc) {
    setStatus(rc, r ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE);
    return nullptr;
}
CMPIStatus resReturnData(const CMPIResult* r, const CMPIValue* value, const CMPIType type) {
    if (!r) return invalidHandle();
    return guardedStatus([&] {
        Collector* c = sinkOf(r);
        if (!c) return closedResult(r);
        Value v;
        CMPIrc rc = readValue(value, type, v);
        if (rc != CMPI_RC_OK) return rcStatus(rc);
        c->data.push_back(std::move(v));
        return okStatus();
    });
}
CMPIStatus resReturnInstance(const CMPIResult* r, const CMPIInstance* inst) {
    if (!r) return invalidHandle();
    InstanceObj* i = asInstance(inst);
    if (!i) return rcStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    return guardedStatus([&] {
        Collector* c = sinkOf(r);
        if (!c) return closedResult(r);
        if (c->sink) {
            if (c->sinkFailure) return rcStatus(CMPI_RC_ERR_FAILED);
            try {
                if (i->inst.path.nameSpace.empty()) {
                    Instance named = i->inst;
                    named.path.nameSpace = c->nameSpace;
                    (*c->sink)(named);
                } else {
                    (*c->sink)(i->inst);
                }
            } catch (...) {
                c->sinkFailure = std::current_exception();
                return rcStatus(CMPI_RC_ERR_FAILED);
            }
            return okStatus();
        }
        c->instances.push_back(i->inst);
        if (c->instances.back().path.nameSpace.empty()) c->instances.back().path.nameSpace = c->nameSpace;
        return okStatus();
    });
}
CMPIStatus resReturnObjectPath(const CMPIResult* r, const CMPIObjectPath* op) {
    if (!r) return invalidHandle();
    PathObj* p = asPath(op);
    if (!p) return rcStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    return guardedStatus([&] {
        Collector* c = sinkOf(r);
        if (!c) return closedResult(r);
        c->paths.push_back(p->path);
        if (c->paths.back().nameSpace.empty()) c->paths.back().nameSpace = c->nameSpace;
        return okStatus();
    });
}
CMPIStatus resReturnDone(const CMPIResult* r) {
    if (!r) return invalidHandle();
    Collector* c = sinkOf(r);
    if (!c) return closedResult(r);
    c->done = true;
    return okStatus();
}
CMPIStatus resReturnError(const CMPIResult* r, const CMPIError*) {
    return rcStatus(r ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE);
}

}  // namespace

CMPIStringFT stringFT = [] {
    auto t = zeroed<CMPIStringFT>();
    t.ftVersion = CMPICurrentVersion;
    t.release = releaseAny<CMPIString>;
    t.clone = cloneOf<StringObj>;
    t.getCharPtr = strGetCharPtr;
    return t;
}();

CMPIInstanceFT instanceFT = [] {
    auto t = zeroed<CMPIInstanceFT>();
    t.ftVersion = CMPICurrentVersion;
    t.release = releaseAny<CMPIInstance>;
    t.clone = cloneOf<InstanceObj>;
    t.getProperty = instGetProperty;
    t.getPropertyAt = instGetPropertyAt;
    t.getPropertyCount = instGetPropertyCount;
    t.setProperty = instSetProperty;
    t.getObjectPath = instGetObjectPath;
    t.setPropertyFilter = instSetPropertyFilter;
    t.setObjectPath = instSetObjectPath;
    t.setPropertyWithOrigin = instSetPropertyWithOrigin;
    return t;
}();

CMPIObjectPathFT objectPathFT = [] {
    auto t = zeroed<CMPIObjectPathFT>();
    t.ftVersion = CMPICurrentVersion;
    t.release = releaseAny<CMPIObjectPath>;
    t.clone = cloneOf<PathObj>;
    t.setNameSpace = pathSetNameSpace;
    t.getNameSpace = pathGetNameSpace;
    t.setHostname = pathSetHostname;
    t.getHostname = pathGetHostname;
    t.setClassName = pathSetClassName;
    t.getClassName = pathGetClassName;
    t.addKey = pathAddKey;
    t.getKey = pathGetKey;
    t.getKeyAt = pathGetKeyAt;
    t.getKeyCount = pathGetKeyCount;
    t.setNameSpaceFromObjectPath = pathSetNameSpaceFromObjectPath;
    t.setHostAndNameSpaceFromObjectPath = pathSetHostAndNameSpaceFromObjectPath;
    t.getClassQualifier = pathGetClassQualifier;
    t.getPropertyQualifier = pathGetPropertyQualifier;
    t.getMethodQualifier = pathGetMethodQualifier;
    t.getParameterQualifier = pathGetParameterQualifier;
    t.toString = pathToString;
    return t;
}();

CMPIArgsFT argsFT = [] {
    auto t = zeroed<CMPIArgsFT>();
    t.ftVersion = CMPICurrentVersion;
    t.release = releaseAny<CMPIArgs>;
    t.clone = cloneOf<ArgsObj>;
    t.addArg = ArgsNamed::add;
    t.getArg = ArgsNamed::get;
    t.getArgAt = ArgsNamed::getAt;
    t.getArgCount = ArgsNamed::count;
    return t;
}();

CMPIArrayFT arrayFT = [] {
    auto t = zeroed<CMPIArrayFT>();
    t.ftVersion = CMPICurrentVersion;
    t.release = releaseAny<CMPIArray>;
    t.clone = cloneOf<ArrayObj>;
    t.getSize = arrGetSize;
    t.getSimpleType = arrGetSimpleType;
    t.getElementAt = arrGetElementAt;
    t.setElementAt = arrSetElementAt;
    return t;
}();

CMPIEnumerationFT enumerationFT = [] {
    auto t = zeroed<CMPIEnumerationFT>();
    t.ftVersion = CMPICurrentVersion;
    t.release = releaseAny<CMPIEnumeration>;
    t.clone = cloneOf<EnumObj>;
    t.getNext = enumGetNext;
    t.hasNext = enumHasNext;
    t.toArray = enumToArray;
    return t;
}();

CMPIDateTimeFT dateTimeFT = [] {
    auto t = zeroed<CMPIDateTimeFT>();
    t.ftVersion = CMPICurrentVersion;
    t.release = releaseAny<CMPIDateTime>;
    t.clone = cloneOf<DateTimeObj>;
    t.getBinaryFormat = dtGetBinaryFormat;
    t.getStringFormat = dtGetStringFormat;
    t.isInterval = dtIsInterval;
    return t;
}();

CMPIContextFT contextFT = [] {
    auto t = zeroed<CMPIContextFT>();
    t.ftVersion = CMPICurrentVersion;
    t.release = releaseAny<CMPIContext>;
    t.clone = cloneOf<ContextObj>;
    t.getEntry = ContextNamed::get;
    t.getEntryAt = ContextNamed::getAt;
    t.getEntryCount = ContextNamed::count;
    t.addEntry = ContextNamed::add;
    return t;
}();

CMPIResultFT resultFT = [] {
    auto t = zeroed<CMPIResultFT>();
    t.ftVersion = CMPICurrentVersion;
    t.release = releaseAny<CMPIResult>;
    t.clone = resClone;
    t.returnData = resReturnData;
    t.returnInstance = resReturnInstance;
    t.returnObjectPath = resReturnObjectPath;
    t.returnDone = resReturnDone;
    t.returnError = resReturnError;
    return t;
}();

// ---- toString / getType --------------------------------------------------------------------

bool describeObject(const void* object, std::string& text, std::string& type) {
    if (!object) return false;
    const void* ft = nullptr;
    std::memcpy(&ft, static_cast<const char*>(object) + offsetof(CMPIString, ft), sizeof ft);
    if (ft == &stringFT) {
        type = "CMPIString";
        text = static_cast<const StringObj*>(static_cast<const CMPIString*>(object))->text;
    } else if (ft == &objectPathFT) {
        type = "CMPIObjectPath";
        text = static_cast<const PathObj*>(static_cast<const CMPIObjectPath*>(object))->path.toString();
    } else if (ft == &instanceFT) {
        type = "CMPIInstance";
        text = static_cast<const InstanceObj*>(static_cast<const CMPIInstance*>(object))->inst.toMof();
    } else if (ft == &argsFT) {
        type = "CMPIArgs";
        text = ArgsNamed::text(object);
    } else if (ft == &arrayFT) {
        type = "CMPIArray";
        const ArrayObj* a = static_cast<const ArrayObj*>(static_cast<const CMPIArray*>(object));
        text = Value::array(a->type, a->elements).toText();
    } else if (ft == &enumerationFT) {
        type = "CMPIEnumeration";
        const EnumObj* e = static_cast<const EnumObj*>(static_cast<const CMPIEnumeration*>(object));
        text = "CMPIEnumeration of " + std::to_string(e->items.size());
    } else if (ft == &dateTimeFT) {
        type = "CMPIDateTime";
        text = static_cast<const DateTimeObj*>(static_cast<const CMPIDateTime*>(object))->text;
    } else if (ft == &contextFT) {
        type = "CMPIContext";
        text = ContextNamed::text(object);
    } else if (ft == &resultFT) {
        type = "CMPIResult";
        text = "CMPIResult";
    } else {
        return false;
    }
    return true;
}

}  // namespace detail
}  // namespace ipif
