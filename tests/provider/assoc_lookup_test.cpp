// The computer system and LAN endpoint lookups against a broker that answers with chosen
// enumerations (and failures).
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <deque>
#include <set>
#include <string>
#include <vector>

#include "CMPI/CMPIIPComputerSystem.h"
#include "CMPI/CMPIIPLanEndPoint.h"
#include "Nx/Exceptions.h"
#include "assoc_fixture.h"

namespace {

using Nx::IPInterfaceProvider::CMPIIPComputerSystem;
using Nx::IPInterfaceProvider::CMPIIPLanEndPoint;

// A broker whose enumerate and get up-calls answer from a script; anything else is absent.
class ScriptedBroker {
public:
    struct Answer {
        std::vector<CMPIInstance*> items;
        std::set<size_t> failingFetches;  // positions whose CMGetNext reports failure
        CMPIrc rc = CMPI_RC_OK;
    };

    ScriptedBroker() {
        ft_.enumerateInstances = &enumerate;
        ft_.getInstance = &get;
        broker_.hdl = this;
        broker_.bft = &ft_;
    }
    ScriptedBroker(const ScriptedBroker&) = delete;
    ScriptedBroker& operator=(const ScriptedBroker&) = delete;

    const CMPIBroker* broker() const { return &broker_; }
    Answer answer;
    std::vector<std::string> calls;  // "enum Class" / "get Class"

    // How many elements of the last enumeration were fetched.
    size_t fetched() const { return enumerations_.empty() ? 0 : enumerations_.back().next; }

private:
    struct Enumeration {
        CMPIEnumeration en;
        Answer answer;
        size_t next = 0;
    };

    static ScriptedBroker& of(const CMPIBroker* mb) { return *static_cast<ScriptedBroker*>(mb->hdl); }
    static std::string className(const CMPIObjectPath* op) {
        CMPIString* name = CMGetClassName(op, nullptr);
        return name ? CMGetCharPtr(name) : "?";
    }

    static CMPIEnumeration* enumerate(const CMPIBroker* mb, const CMPIContext*, const CMPIObjectPath* op, const char**,
                                      CMPIStatus* rc) {
        ScriptedBroker& self = of(mb);
        self.calls.push_back("enum " + className(op));
        rc->rc = self.answer.rc;
        if (self.answer.rc != CMPI_RC_OK) return nullptr;
        self.enumerations_.push_back(Enumeration{{nullptr, &kEnumerationFT}, self.answer, 0});
        Enumeration& e = self.enumerations_.back();
        e.en.hdl = &e;
        return &e.en;
    }

    static CMPIInstance* get(const CMPIBroker* mb, const CMPIContext*, const CMPIObjectPath* op, const char**,
                             CMPIStatus* rc) {
        ScriptedBroker& self = of(mb);
        self.calls.push_back("get " + className(op));
        rc->rc = self.answer.rc;
        return self.answer.rc == CMPI_RC_OK && !self.answer.items.empty() ? self.answer.items.front() : nullptr;
    }

    // Past the end: not found; a failing position: failed, and the element is lost.
    static CMPIData getNext(const CMPIEnumeration* en, CMPIStatus* rc) {
        Enumeration& e = *static_cast<Enumeration*>(en->hdl);
        CMPIData data{CMPI_null, CMPI_nullValue, {}};
        CMPIrc status = CMPI_RC_ERR_NOT_FOUND;
        if (e.next < e.answer.items.size()) {
            const size_t at = e.next++;
            status = e.answer.failingFetches.count(at) ? CMPI_RC_ERR_FAILED : CMPI_RC_OK;
            if (status == CMPI_RC_OK) {
                data = CMPIData{CMPI_instance, CMPI_goodValue, {}};
                data.value.inst = e.answer.items[at];
            }
        }
        if (rc) rc->rc = status;
        return data;
    }
    static CMPIBoolean hasNext(const CMPIEnumeration* en, CMPIStatus* rc) {
        const Enumeration& e = *static_cast<const Enumeration*>(en->hdl);
        if (rc) rc->rc = CMPI_RC_OK;
        return e.next < e.answer.items.size();
    }

    static inline CMPIEnumerationFT kEnumerationFT = {200, nullptr, nullptr, &getNext, &hasNext, nullptr};
    CMPIBrokerFT ft_{};
    CMPIBroker broker_{};
    std::deque<Enumeration> enumerations_;
};

class Lookups : public assoctest::AssocTest {
protected:
    CMPIObjectPath* named(const std::string& cls, const std::string& name) {
        CMPIObjectPath* p = CMNewObjectPath(host().broker(), "root/cimv2", cls.c_str(), nullptr);
        if (!name.empty()) CMAddKey(p, "Name", name.c_str(), CMPI_chars);
        return p;
    }
    // A system (or LAN endpoint) instance made by the embedded host's broker.
    CMPIInstance* system(const std::string& cls, const std::string& name) {
        CMPIObjectPath* p = named(cls, name);
        CMAddKey(p, "CreationClassName", cls.c_str(), CMPI_chars);
        CMPIInstance* i = CMNewInstance(host().broker(), p, nullptr);
        CMSetProperty(i, "Name", name.c_str(), CMPI_chars);
        return i;
    }
    static std::string nameOf(CMPIObjectPath* p) {
        if (!p) return "(none)";
        CMPIData d = CMGetKey(p, "Name", nullptr);
        return d.type == CMPI_string && d.value.string ? CMGetCharPtr(d.value.string) : "(no name)";
    }
    // Names reported while walking: operator bool, the current path's name, operator++.
    template <class Lookup>
    static std::vector<std::string> walk(Lookup& lookup) {
        std::vector<std::string> seen;
        for (int guard = 0; lookup && guard < 10; ++guard, ++lookup) seen.push_back(nameOf(lookup.getObjectPath()));
        return seen;
    }

    ScriptedBroker scripted;
};

using Names = std::vector<std::string>;

TEST_F(Lookups, ComputerSystemIterationRules) {
    const char* cs = "KVRNX_ComputerSystem";
    struct Row {
        const char* what;
        Names systems;
        std::set<size_t> failing;
        bool findSP;
        const char* wanted;
        Names walked;
    };
    const std::vector<Row> rows = {
        {"first of all, then the rest", {"a", "b"}, {}, false, "", {"a", "b"}},
        {"the named one, then the end", {"a", "b", "c"}, {}, true, "b", {"b"}},
        {"no match keeps the last", {"a", "b", "c"}, {}, true, "x", {"c"}},
        {"case matters", {"a", "B", "c"}, {}, true, "b", {"c"}},
        {"a failed fetch is passed over", {"a", "b", "c"}, {1}, true, "b", {"c"}},
        {"and is not the last one kept", {"a", "b", "c"}, {2}, true, "x", {"b"}},
        {"a path without Name keeps the last", {"a", "b"}, {}, true, "", {"b"}},
        {"empty enumeration", {}, {}, true, "a", {}},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.what);
        scripted.answer = {};
        for (const std::string& name : row.systems) scripted.answer.items.push_back(system(cs, name));
        scripted.answer.failingFetches = row.failing;
        CMPIIPComputerSystem lookup(scripted.broker(), nullptr, "root/cimv2");
        lookup.setObjectPath(named(cs, row.wanted), row.findSP);
        // Looking by name always drains the enumeration.
        if (row.findSP) {
            EXPECT_EQ(scripted.fetched(), row.systems.size());
        }
        EXPECT_EQ(lookup.getCMPIInstance(nullptr) != nullptr, !row.walked.empty());
        EXPECT_EQ(walk(lookup), row.walked);
        EXPECT_FALSE(static_cast<bool>(lookup));
        EXPECT_EQ(lookup.getObjectPath(), nullptr);
    }
    EXPECT_EQ(scripted.calls.size(), rows.size());
    EXPECT_EQ(scripted.calls.front(), "enum KVRNX_ComputerSystem");

    scripted.answer = {};
    scripted.answer.rc = CMPI_RC_ERR_FAILED;
    CMPIIPComputerSystem failing(scripted.broker(), nullptr, "root/cimv2");
    try {
        failing.setObjectPath(named(cs, ""), false);
        ADD_FAILURE() << "no exception";
    } catch (const Nx::ProviderException& e) {
        EXPECT_STREQ(e.what(), "Could not obtain an instance of Computer System");
    }
    EXPECT_FALSE(static_cast<bool>(failing));
}

TEST_F(Lookups, LanEndpointIsOneShot) {
    const char* lan = "KVRNX_LANEndpoint";
    scripted.answer.items = {system(lan, "eth0"), system(lan, "eth1")};
    CMPIIPLanEndPoint enumerated(scripted.broker(), nullptr, "root/cimv2");
    enumerated.setObjectPath(named(lan, ""));
    EXPECT_EQ(walk(enumerated), (Names{"eth0"}));
    EXPECT_EQ(scripted.fetched(), 2u);  // the one advance fetched the second, which is not reported
    // Asking again does not bring it back either.
    EXPECT_FALSE(static_cast<bool>(enumerated));

    CMPIIPLanEndPoint single(scripted.broker(), nullptr, "root/cimv2");
    single.setSingleObjectPath(named(lan, "eth0"));
    EXPECT_EQ(nameOf(single.getObjectPath()), "eth0");
    EXPECT_TRUE(static_cast<bool>(single));
    EXPECT_FALSE(static_cast<bool>(single));
    EXPECT_EQ(scripted.calls, (Names{"enum KVRNX_LANEndpoint", "get KVRNX_LANEndpoint"}));

    scripted.answer = {};
    CMPIIPLanEndPoint empty(scripted.broker(), nullptr, "root/cimv2");
    empty.setObjectPath(named(lan, ""));
    EXPECT_FALSE(static_cast<bool>(empty));

    for (CMPIrc rc : {CMPI_RC_ERR_NOT_FOUND, CMPI_RC_ERR_FAILED}) {
        scripted.answer = {};
        scripted.answer.rc = rc;
        CMPIIPLanEndPoint failing(scripted.broker(), nullptr, "root/cimv2");
        EXPECT_THROW(failing.setSingleObjectPath(named(lan, "eth0")), Nx::ProviderException);
        EXPECT_THROW(failing.setObjectPath(named(lan, "")), Nx::ProviderException);
        EXPECT_FALSE(static_cast<bool>(failing));
    }
}

}  // namespace
