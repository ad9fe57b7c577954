// The computer system and LAN endpoint lookups against a broker that answers with chosen
// enumerations (and failures), and the hosted associations' handling of an association path.
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <deque>
#include <set>
#include <string>
#include <vector>

#include "CMPI/CMPIIPComputerSystem.h"
#include "CMPI/CMPIIPHostedAccessPoint.h"
#include "CMPI/CMPIIPLanEndPoint.h"
#include "Nx/Exceptions.h"
#include "Nx/HostModel.h"
#include "assoc_fixture.h"

namespace {

using Nx::IPInterfaceProvider::CMPIIPComputerSystem;
using Nx::IPInterfaceProvider::CMPIIPHostedAccessPoint;
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

    static CMPIData getNext(const CMPIEnumeration* en, CMPIStatus* rc) {
        Enumeration& e = *static_cast<Enumeration*>(en->hdl);
        CMPIData data{};
        data.type = CMPI_null;
        data.state = CMPI_nullValue;
        if (e.next >= e.answer.items.size()) {
            if (rc) rc->rc = CMPI_RC_ERR_NOT_FOUND;
            return data;
        }
        const size_t at = e.next++;
        if (e.answer.failingFetches.count(at)) {
            if (rc) rc->rc = CMPI_RC_ERR_FAILED;
            return data;
        }
        if (rc) rc->rc = CMPI_RC_OK;
        data.type = CMPI_instance;
        data.state = CMPI_goodValue;
        data.value.inst = e.answer.items[at];
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
    // A system (or LAN endpoint) instance made by the embedded host's broker.
    CMPIInstance* system(const std::string& cls, const std::string& name) {
        const CMPIBroker* b = host().broker();
        CMPIObjectPath* p = CMNewObjectPath(b, "root/cimv2", cls.c_str(), nullptr);
        CMAddKey(p, "CreationClassName", cls.c_str(), CMPI_chars);
        CMAddKey(p, "Name", name.c_str(), CMPI_chars);
        CMPIInstance* i = CMNewInstance(b, p, nullptr);
        CMSetProperty(i, "Name", name.c_str(), CMPI_chars);
        return i;
    }
    CMPIObjectPath* named(const std::string& cls, const std::string& name) {
        CMPIObjectPath* p = CMNewObjectPath(host().broker(), "root/cimv2", cls.c_str(), nullptr);
        if (!name.empty()) CMAddKey(p, "Name", name.c_str(), CMPI_chars);
        return p;
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
        {"empty enumeration", {}, {}, false, "", {}},
        {"empty enumeration, by name", {}, {}, true, "a", {}},
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

// An association path of a hosted association positions the endpoint it names, and the computer
// only when that is the endpoint's computer; the constructor then goes on as for a computer path,
// which the association path is not.
TEST_F(Lookups, HostedAssociationPathIsTakenApartButNeverServed) {
    Nx::HostModel::setCurrent(Nx::HostModel::open("fixture:" + model));
    const CMPIBroker* b = host().broker();
    auto cmpiPath = [&](const ipif::ObjectPath& p, auto& self) -> CMPIObjectPath* {
        CMPIObjectPath* out = CMNewObjectPath(b, "root/cimv2", p.className.c_str(), nullptr);
        for (const auto& [name, value] : p.keys) {
            if (value.type() == ipif::CimType::Reference) {
                CMPIValue ref;
                ref.ref = self(value.asReference(), self);
                CMAddKey(out, name.c_str(), &ref, CMPI_ref);
            } else {
                CMAddKey(out, name.c_str(), value.asString().c_str(), CMPI_chars);
            }
        }
        return out;
    };
    auto instancePath = [&](const std::string& computer) {
        ipif::ObjectPath p("root/cimv2", "KVRNX_IPHostedAccessPoint");
        ipif::ObjectPath cs("root/cimv2", "KVRNX_ComputerSystem");
        cs.keys.set("CreationClassName", ipif::Value::string("KVRNX_ComputerSystem"));
        cs.keys.set("Name", ipif::Value::string(computer));
        p.keys.set("Antecedent", ipif::Value::reference(cs));
        p.keys.set("Dependent", ipif::Value::reference(path("EP:eth1")));
        return cmpiPath(p, cmpiPath);
    };
    CMPIObjectPath* service = cmpiPath(path("SVC"), cmpiPath);

    for (const std::string& computer : {hostName, std::string("elsewhere")}) {
        SCOPED_TRACE(computer);
        CMPIIPHostedAccessPoint adapter(b, nullptr, service);  // no end of this association
        EXPECT_FALSE(static_cast<bool>(adapter));
        EXPECT_EQ(adapter.getAssociatorNames(), nullptr);
        EXPECT_TRUE(adapter.isNotTargetClass("CIM_ComputerSystem"));
        EXPECT_FALSE(adapter.setObjectPath(instancePath(computer)));
        ASSERT_TRUE(static_cast<bool>(adapter));
        CMPIObjectPath* pair = adapter.getObjectPath();
        CMPIData dependent = CMGetKey(pair, "Dependent", nullptr);
        ASSERT_EQ(dependent.type, CMPI_ref);
        EXPECT_EQ(nameOf(dependent.value.ref), "eth1");
        CMPIStatus rc = {CMPI_RC_OK, nullptr};
        CMPIData antecedent = CMGetKey(pair, "Antecedent", &rc);
        if (computer == hostName) {
            ASSERT_EQ(antecedent.type, CMPI_ref);
            EXPECT_EQ(nameOf(antecedent.value.ref), hostName);
        } else {
            EXPECT_NE(rc.rc, CMPI_RC_OK);
        }
    }
    CMPIIPHostedAccessPoint keyless(b, nullptr, service);
    EXPECT_TRUE(keyless.setObjectPath(CMNewObjectPath(b, "root/cimv2", "KVRNX_IPHostedAccessPoint", nullptr)));
    int pairs = 0;
    for (; keyless; ++keyless) ++pairs;
    EXPECT_EQ(pairs, 4);

    try {
        CMPIIPHostedAccessPoint fromInstancePath(b, nullptr, instancePath(hostName));
        ADD_FAILURE() << "no exception";
    } catch (const Nx::FrameworkException& e) {
        EXPECT_STREQ(e.what(), "Could not find 'Name' key in Moniker");
    }
    Nx::HostModel::setCurrent(nullptr);
}

}  // namespace
