// The host end to end through the test providers: loading, every operation, up-calls between
// providers, the broker's services, memory ownership and threads.
#include <gtest/gtest.h>

#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <fstream>
#include <thread>

#include "HostTestSupport.h"

using namespace ipif;

namespace {

class HostTest : public ::testing::Test {
protected:
    std::unique_ptr<Host> host = std::make_unique<Host>(testHostOptions());

    Result call(const std::string& method, const Args& in = Args(), const std::string& id = "w1") {
        return host->invokeMethod(widgetPath(id), method, in);
    }
};

ObjectPath gadgetPath(const std::string& name, std::uint32_t slot) {
    ObjectPath p("root/cimv2", "IPIFTEST_Gadget");
    p.keys.set("Name", Value::string(name));
    p.keys.set("Slot", Value::uint32(slot));
    return p;
}

std::string tempFile(const char* tag) {
    return testing::TempDir() + "/ipif-host-" + tag + "-" + std::to_string(getpid());
}

}  // namespace

TEST_F(HostTest, EnumeratesAndGetsInstancesWithTheirTypes) {
    Result names = host->enumerateInstanceNames("root/cimv2", "IPIFTEST_Widget");
    ASSERT_TRUE(names.ok()) << names.message;
    ASSERT_EQ(names.paths.size(), 2u);
    EXPECT_EQ(names.paths[1], widgetPath("w\"2\\x"));
    EXPECT_TRUE(names.done);

    Result all = host->enumerateInstances("", "IPIFTEST_Widget");
    ASSERT_EQ(all.instances.size(), 2u);
    const Instance& w1 = all.instances[0];
    EXPECT_EQ(w1.path.nameSpace, "root/cimv2");
    EXPECT_EQ(*w1.property("Size"), Value::uint16(10));
    EXPECT_EQ(w1.property("Tags")->toText(), "{\"a\", \"b,c\"}");
    EXPECT_EQ(*w1.property("Created"), Value::dateTime("20240102030405.000006+060"));
    EXPECT_EQ(*w1.property("Enabled"), Value::boolean(true));
    EXPECT_EQ(*w1.property("Offset"), Value::sint32(-5));
    EXPECT_EQ(*w1.property("Ratio"), Value::real64(0.5));
    EXPECT_EQ(*w1.property("InstanceID"), Value::string("w1"));  // keys become properties

    Result one = host->getInstance(host->parsePath("IPIFTEST_Widget.InstanceID=\"w\\\"2\\\\x\""));
    ASSERT_EQ(one.instances.size(), 1u);
    EXPECT_EQ(one.instances[0].property("ElementName")->asString(), "awkward, \"one\"");

    std::vector<std::string> onlySize = {"Size"};
    Result filtered = host->enumerateInstances("root/cimv2", "IPIFTEST_Widget", &onlySize);
    EXPECT_EQ(filtered.instances[0].properties.size(), 2u);  // the key and Size
    EXPECT_EQ(filtered.instances[0].property("Ratio"), nullptr);

    // A parent class reaches every provider of its subclasses; namespaces are honoured.
    EXPECT_EQ(host->enumerateInstances("root/cimv2", "ipiftest_element").instances.size(), 3u);
    EXPECT_EQ(host->enumerateInstanceNames("root/test", "IPIFTEST_Element").paths.size(), 2u);
    EXPECT_TRUE(host->enumerateInstanceNames("root/test", "IPIFTEST_Gadget").paths.empty());

    Result missing = host->getInstance(widgetPath("nope"));
    EXPECT_EQ(missing.rc, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(missing.message, "no such widget");
    EXPECT_EQ(host->enumerateInstances("root/cimv2", "IPIFTEST_Nope").rc, CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(host->getInstance(ObjectPath::parse("IPIFTEST_Widget.Colour=1")).rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

TEST_F(HostTest, ModifyCreateDeleteAndQueryArePassedOn) {
    Instance change;
    change.properties.set("Size", Value::uint16(42));
    ASSERT_TRUE(host->modifyInstance(widgetPath("w1"), change).ok());
    EXPECT_EQ(*host->getInstance(widgetPath("w1")).instances.at(0).property("Size"), Value::uint16(42));

    change.properties.set("Size", Value::uint16(5000));
    Result tooLarge = host->modifyInstance(widgetPath("w1"), change);
    EXPECT_EQ(tooLarge.rc, CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(tooLarge.message, "Size too large");
    change.properties.set("Size", Value::uint32(7));  // passed as given, the provider objects
    EXPECT_EQ(host->modifyInstance(widgetPath("w1"), change).rc, CMPI_RC_ERR_TYPE_MISMATCH);
    change.properties.set("Size", Value::uint16(10));
    EXPECT_TRUE(host->modifyInstance(widgetPath("w1"), change).ok());

    Instance fresh;
    fresh.properties.set("InstanceID", Value::string("w3"));
    fresh.properties.set("ElementName", Value::string("third"));
    Result created = host->createInstance(widgetPath("w3"), fresh);
    ASSERT_TRUE(created.ok()) << created.message;
    EXPECT_EQ(created.paths, std::vector<ObjectPath>{widgetPath("w3")});
    EXPECT_EQ(host->createInstance(widgetPath("w3"), fresh).rc, CMPI_RC_ERR_ALREADY_EXISTS);

    Result query = host->execQuery("root/cimv2", "IPIFTEST_Widget", "SELECT * WHERE ElementName = 'third'", "WQL");
    ASSERT_EQ(query.instances.size(), 1u);
    EXPECT_EQ(query.instances[0].path, widgetPath("w3"));
    EXPECT_EQ(host->execQuery("root/cimv2", "IPIFTEST_Widget", "x", "CQL").rc,
              CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED);

    EXPECT_TRUE(host->deleteInstance(widgetPath("w3")).ok());
    EXPECT_EQ(host->deleteInstance(widgetPath("w3")).rc, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(host->modifyInstance(gadgetPath("g1", 1), change).rc, CMPI_RC_ERR_NOT_SUPPORTED);
    // A known class no provider serves.
    EXPECT_EQ(host->getInstance(ObjectPath::parse("IPIFTEST_WidgetGadget")).rc, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(HostTest, AssociationsReachOtherProvidersThroughUpCalls) {
    // Widget -> gadgets: the widget provider enumerates the gadget provider's instances.
    Result gadgets = host->associators(widgetPath("w1"));
    ASSERT_TRUE(gadgets.ok()) << gadgets.message;
    ASSERT_EQ(gadgets.instances.size(), 2u);
    EXPECT_EQ(gadgets.instances[1].path, gadgetPath("g,2=\"x\"", 2));
    EXPECT_EQ(host->associatorNames(widgetPath("w1"), "IPIFTEST_WidgetGadget", "ipiftest_gadget").paths.size(), 2u);
    EXPECT_TRUE(host->associatorNames(widgetPath("w1"), "", "IPIFTEST_Widget").paths.empty());

    // Gadget -> widget: a get from the gadget provider, then one back into the widget provider.
    Result owner = host->associators(gadgetPath("g3", 3));
    ASSERT_EQ(owner.instances.size(), 1u) << owner.message;
    EXPECT_EQ(owner.instances[0].path, widgetPath("w\"2\\x"));
    EXPECT_EQ(owner.instances[0].property("ElementName")->asString(), "awkward, \"one\"");

    Result links = host->references(widgetPath("w1"));
    ASSERT_EQ(links.instances.size(), 2u);
    EXPECT_EQ(*links.instances[1].property("Weight"), Value::uint16(20));
    Result linkNames = host->referenceNames(widgetPath("w1"), "IPIFTEST_WidgetGadget", "Widget");
    ASSERT_EQ(linkNames.paths.size(), 2u);
    EXPECT_EQ(linkNames.paths[1].keys.find("Gadget")->asReference(), gadgetPath("g,2=\"x\"", 2));
    // The printed association path reads back to the same path.
    EXPECT_EQ(host->parsePath(linkNames.paths[1].toString()), linkNames.paths[1]);

    // A role the source cannot play finds no association; an unknown filter class goes to the
    // provider, which finds nothing for it.
    EXPECT_TRUE(host->referenceNames(widgetPath("w1"), "", "Gadget").paths.empty());
    Result unknown = host->associatorNames(widgetPath("w1"), "IPIFTEST_Unknown");
    EXPECT_TRUE(unknown.ok());
    EXPECT_TRUE(unknown.paths.empty());
    EXPECT_EQ(host->associators(ObjectPath::parse("IPIFTEST_Nope.X=1")).rc, CMPI_RC_ERR_INVALID_CLASS);
}

TEST_F(HostTest, SinksTakeTheCallersInstancesAsTheyAreReturned) {
    std::vector<Instance> seen;
    const InstanceSink keep = [&](const Instance& inst) { seen.push_back(inst); };
    const auto samePaths = [](const std::vector<Instance>& a, const std::vector<Instance>& b) {
        if (a.size() != b.size()) return false;
        for (std::size_t i = 0; i < a.size(); ++i)
            if (a[i].path != b[i].path || !a[i].properties.sameAs(b[i].properties)) return false;
        return true;
    };

    Result streamed = host->enumerateInstances("root/cimv2", "IPIFTEST_Widget", nullptr, &keep);
    ASSERT_TRUE(streamed.ok()) << streamed.message;
    EXPECT_TRUE(streamed.instances.empty());
    EXPECT_TRUE(samePaths(seen, host->enumerateInstances("root/cimv2", "IPIFTEST_Widget").instances));

    // The widget provider's own up-call for the gadgets keeps its answer: only what reaches the
    // caller goes to the sink.
    seen.clear();
    ASSERT_TRUE(host->associators(widgetPath("w1"), "", "", "", "", nullptr, &keep).ok());
    EXPECT_TRUE(samePaths(seen, host->associators(widgetPath("w1")).instances));
    EXPECT_EQ(seen.size(), 2u);

    // A failing sink ends the request with its reason and is not called again.
    int calls = 0;
    const InstanceSink failing = [&](const Instance&) {
        ++calls;
        throw std::runtime_error("output closed");
    };
    Result failed = host->enumerateInstances("root/cimv2", "IPIFTEST_Widget", nullptr, &failing);
    EXPECT_EQ(failed.rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(failed.message, "output closed");
    EXPECT_EQ(calls, 1);
    const InstanceSink odd = [](const Instance&) { throw 7; };
    EXPECT_THROW(host->getInstance(widgetPath("w1"), nullptr, &odd), int);
    EXPECT_EQ(host->stats().liveObjects, 0);
}

TEST_F(HostTest, MethodsReturnValuesOutArgumentsAndStatuses) {
    Args in;
    in.set("NewSize", Value::uint16(12));
    Result r = call("Resize", in);
    ASSERT_TRUE(r.ok()) << r.message;
    ASSERT_TRUE(r.hasReturnValue);
    EXPECT_EQ(r.returnValue, Value::uint32(0));
    EXPECT_EQ(r.outArgs.find("Gadget")->asReference(), gadgetPath("made", 7));
    EXPECT_EQ(r.outArgs.find("Log")->toText(), "{\"resized\", \"w1\"}");
    in.set("Gadget", Value::reference(gadgetPath("g3", 3)));
    EXPECT_EQ(call("Resize", in).outArgs.find("Gadget")->asReference(), gadgetPath("g3", 3));

    in.set("NewSize", Value::uint32(12));
    Result wrongType = call("Resize", in);
    EXPECT_EQ(wrongType.rc, CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(wrongType.message, "NewSize must be uint16");
    EXPECT_EQ(wrongType.returnValue, Value::uint32(4));

    Result fail = call("Fail");
    EXPECT_EQ(fail.rc, CMPI_RC_ERR_ACCESS_DENIED);
    EXPECT_EQ(fail.message, "denied\nby the widget");
    Result thrown = call("Throw");
    EXPECT_EQ(thrown.rc, CMPI_RC_ERR_FAILED);
    EXPECT_NE(thrown.message.find("widget exploded"), std::string::npos);
    EXPECT_EQ(call("Polish").rc, CMPI_RC_ERR_METHOD_NOT_FOUND);
    EXPECT_EQ(host->invokeMethod(gadgetPath("g1", 1), "Resize", Args()).rc, CMPI_RC_ERR_NOT_SUPPORTED);

    // Re-entrant up-calls into the same provider, and the nesting limit.
    Args deep;
    deep.set("Levels", Value::uint32(20));
    EXPECT_EQ(call("Deep", deep).returnValue, Value::uint32(20));
    deep.set("Levels", Value::uint32(100));
    Result tooDeep = call("Deep", deep);
    EXPECT_EQ(tooDeep.rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(tooDeep.message, "up-calls nested too deep");
}

TEST_F(HostTest, BrokerAnswersFromTheClassesAndDescribesObjects) {
    Args in;
    in.set("ClassName", Value::string("ipiftest_ELEMENT"));
    Result probe = call("Probe", in);
    ASSERT_TRUE(probe.ok()) << probe.message;
    EXPECT_TRUE(probe.outArgs.find("IsA")->asBool());
    EXPECT_EQ(probe.outArgs.find("Text")->asString(), "root/cimv2:IPIFTEST_Widget.InstanceID=\"w1\"");
    EXPECT_EQ(probe.outArgs.find("Type")->asString(), "CMPIObjectPath");
    in.set("ClassName", Value::string("IPIFTEST_Gadget"));
    EXPECT_FALSE(call("Probe", in).outArgs.find("IsA")->asBool());

    const CMPIBroker* b = host->broker();
    CMPIStatus rc = {CMPI_RC_OK, NULL};
    CMPIObjectPath* unknown = CMNewObjectPath(b, "root/cimv2", "IPIFTEST_Nope", &rc);
    EXPECT_FALSE(CMClassPathIsA(b, unknown, "IPIFTEST_Nope", &rc));
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(CMNewInstance(b, unknown, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_FOUND);

    // Setting a key property moves it into the instance's path.
    CMPIObjectPath* op = CMNewObjectPath(b, "root/cimv2", "IPIFTEST_Widget", NULL);
    CMPIInstance* inst = CMNewInstance(b, op, &rc);
    ASSERT_EQ(rc.rc, CMPI_RC_OK);
    CMSetProperty(inst, "instanceid", "k\"1", CMPI_chars);
    CMPIObjectPath* instPath = CMGetObjectPath(inst, NULL);
    CMPIData key = CMGetKey(instPath, "InstanceID", &rc);
    EXPECT_EQ(key.type, CMPI_string);
    EXPECT_TRUE(key.state & CMPI_keyValue);
    EXPECT_STREQ(CMGetCharPtr(CDToString(b, instPath, NULL)), "root/cimv2:IPIFTEST_Widget.InstanceID=\"k\\\"1\"");
    EXPECT_TRUE(CDIsOfType(b, inst, "CMPIInstance", NULL));
    EXPECT_FALSE(CDIsOfType(b, inst, "CMPIString", NULL));
    CMGetProperty(inst, "Nope", &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);

    CMPIDateTime* hour = CMNewDateTimeFromChars(b, "00000000010000.000250:000", &rc);
    ASSERT_NE(hour, nullptr);
    EXPECT_EQ(CMGetBinaryFormat(hour, NULL), 3600000250ULL);
    EXPECT_TRUE(CMIsInterval(hour, NULL));
    CMPIDateTime* stamp = CMNewDateTimeFromChars(b, "20240102030405.000006+060", NULL);
    CMPIDateTime* back = CMNewDateTimeFromBinary(b, CMGetBinaryFormat(stamp, NULL), 0, NULL);
    EXPECT_STREQ(CMGetCharPtr(CMGetStringFormat(back, NULL)), "20240102020405.000006+000");
    EXPECT_EQ(CMNewDateTimeFromChars(b, "2024", &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_PARAMETER);

    CMPIArray* arr = CMNewArray(b, 2, CMPI_uint16, NULL);
    CMPIUint16 v = 3;
    EXPECT_EQ(CMSetArrayElementAt(arr, 1, &v, CMPI_uint16).rc, CMPI_RC_OK);
    EXPECT_EQ(CMSetArrayElementAt(arr, 0, "x", CMPI_chars).rc, CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(CMSetArrayElementAt(arr, 2, &v, CMPI_uint16).rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    EXPECT_TRUE(CMGetArrayElementAt(arr, 0, NULL).state & CMPI_nullValue);
    EXPECT_EQ(CMGetArrayElementAt(arr, 1, NULL).value.uint16, 3);
    // Objects made outside any request stay with the host until it goes.
    EXPECT_GT(host->stats().liveObjects, 0);
}

TEST_F(HostTest, EveryFunctionTableSlotIsFilled) {
    const CMPIBroker* b = host->broker();
    auto allSet = [](const void* table, std::size_t size, std::size_t skip) {
        const char* p = static_cast<const char*>(table) + skip;
        for (std::size_t off = 0; off + sizeof(void*) <= size - skip; off += sizeof(void*)) {
            void* slot;
            std::memcpy(&slot, p + off, sizeof slot);
            if (!slot) return false;
        }
        return true;
    };
    EXPECT_TRUE(allSet(b->bft, sizeof *b->bft, offsetof(CMPIBrokerFT, prepareAttachThread)));
    EXPECT_TRUE(allSet(b->eft, sizeof *b->eft, offsetof(CMPIBrokerEncFT, newInstance)));
    EXPECT_TRUE(allSet(b->xft, sizeof *b->xft, offsetof(CMPIBrokerExtFT, resolveFileName)));
    ASSERT_NE(b->mft, nullptr);
    EXPECT_TRUE(allSet(b->mft, sizeof *b->mft, offsetof(CMPIBrokerMemFT, mark)));
    CMPIObjectPath* op = CMNewObjectPath(b, "root/cimv2", "IPIFTEST_Widget", NULL);
    CMPIInstance* inst = CMNewInstance(b, op, NULL);
    CMPIArray* arr = CMNewArray(b, 1, CMPI_string, NULL);
    CMPIArgs* args = CMNewArgs(b, NULL);
    CMPIString* str = CMNewString(b, "s", NULL);
    CMPIDateTime* dt = CMNewDateTime(b, NULL);
    CMPIEnumeration* en = CBEnumInstanceNames(b, CBPrepareAttachThread(b, NULL), op, NULL);
    ASSERT_NE(en, nullptr);
    EXPECT_TRUE(allSet(op->ft, sizeof *op->ft, offsetof(CMPIObjectPathFT, release)));
    EXPECT_TRUE(allSet(inst->ft, sizeof *inst->ft, offsetof(CMPIInstanceFT, release)));
    EXPECT_TRUE(allSet(arr->ft, sizeof *arr->ft, offsetof(CMPIArrayFT, release)));
    EXPECT_TRUE(allSet(args->ft, sizeof *args->ft, offsetof(CMPIArgsFT, release)));
    EXPECT_TRUE(allSet(str->ft, sizeof *str->ft, offsetof(CMPIStringFT, release)));
    EXPECT_TRUE(allSet(dt->ft, sizeof *dt->ft, offsetof(CMPIDateTimeFT, release)));
    EXPECT_TRUE(allSet(en->ft, sizeof *en->ft, offsetof(CMPIEnumerationFT, release)));
    EXPECT_EQ(CMGetArrayCount(CMToArray(en, NULL), NULL), 2u);
}

TEST_F(HostTest, RequestMemoryGoesWithTheRequestAndClonesWithRelease) {
    ASSERT_EQ(host->stats().liveObjects, 0);
    host->associators(gadgetPath("g3", 3));
    host->references(widgetPath("w1"));
    Args in;
    in.set("NewSize", Value::uint16(10));
    call("Resize", in);
    EXPECT_EQ(host->stats().liveObjects, 0);

    in = Args();
    in.set("Release", Value::boolean(false));
    call("Stash", in);
    EXPECT_EQ(host->stats().liveClones, 1);
    EXPECT_EQ(host->stats().liveObjects, 1);
    in.set("Release", Value::boolean(true));
    call("Stash", in);
    EXPECT_EQ(host->stats().liveClones, 0);
    EXPECT_EQ(host->stats().liveObjects, 0);
    in.set("Release", Value::boolean(false));
    call("Stash", in);  // never released: the host frees it when it goes (LSan watches)
    EXPECT_EQ(host->stats().liveClones, 1);

    // The memory table: mark/release need a request of this thread, which attaching gives.
    const CMPIBroker* b = host->broker();
    CMPIStatus rc = {CMPI_RC_OK, NULL};
    EXPECT_EQ(b->mft->mark(b, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    long outside = host->stats().liveObjects;
    CMPIContext* ctx = CBPrepareAttachThread(b, NULL);
    ASSERT_EQ(CBAttachThread(b, ctx).rc, CMPI_RC_OK);
    long before = host->stats().liveObjects;
    CMPIGcStat* mark = b->mft->mark(b, &rc);
    ASSERT_NE(mark, nullptr);
    CMNewString(b, "a", NULL);
    CMNewObjectPath(b, "root/cimv2", "IPIFTEST_Widget", NULL);
    EXPECT_EQ(host->stats().liveObjects, before + 2);
    EXPECT_EQ(b->mft->release(b, mark).rc, CMPI_RC_OK);
    EXPECT_EQ(host->stats().liveObjects, before);
    char* s = b->mft->cmpiStrDup(b, "copy");
    s = static_cast<char*>(b->mft->cmpiRealloc(b, s, 64));
    ASSERT_NE(s, nullptr);
    EXPECT_STREQ(s, "copy");
    b->mft->cmpiFree(b, s);
    b->mft->cmpiMalloc(b, 32);  // goes at detach (LSan watches)
    CMNewArgs(b, NULL);
    EXPECT_EQ(CBDetachThread(b, ctx).rc, CMPI_RC_OK);
    EXPECT_EQ(host->stats().liveObjects, outside);
    EXPECT_EQ(CBDetachThread(b, ctx).rc, CMPI_RC_ERR_FAILED);  // not attached any more
}

TEST_F(HostTest, DetachedProviderThreadsAreAwaited) {
#if defined(__SANITIZE_THREAD__)
    GTEST_SKIP() << "ThreadSanitizer keeps a thread of its own that starts after the host";
#endif
    std::string file = tempFile("spawn");
    std::remove(file.c_str());
    Args in;
    in.set("Millis", Value::uint32(800));
    in.set("File", Value::string(file));
    ASSERT_TRUE(call("Spawn", in).ok());
    EXPECT_FALSE(host->waitForProviderThreads(std::chrono::milliseconds(20)));
    EXPECT_TRUE(host->waitForProviderThreads(std::chrono::seconds(10)));
    std::ifstream f(file);
    std::string content;
    std::getline(f, content);
    EXPECT_EQ(content, "done");
    std::remove(file.c_str());
    EXPECT_EQ(host->stats().liveObjects, 0);  // the attached thread's objects went at detach
}

TEST_F(HostTest, ConcurrentRequestsShareProvidersLoadedOnce) {
    auto factoryCalls = [&] {
        Args in;
        in.set("ClassName", Value::string("IPIFTEST_Widget"));
        return call("Probe", in).outArgs.find("Factories")->asUnsigned();
    };
    std::uint64_t before = factoryCalls();  // the method MI is loaded by now
    std::vector<std::thread> threads;
    std::atomic<int> failures{0};
    for (int t = 0; t < 4; ++t)
        threads.emplace_back([&, t] {
            for (int i = 0; i < 40; ++i) {
                Result r;
                switch ((i + t) % 4) {
                case 0: r = host->enumerateInstances("root/cimv2", "IPIFTEST_Element"); break;
                case 1: r = host->associators(gadgetPath("g3", 3)); break;
                case 2: r = host->referenceNames(widgetPath("w1")); break;
                default: {
                    Args in;
                    in.set("Levels", Value::uint32(3));
                    r = call("Deep", in);
                }
                }
                if (!r.ok() || (r.instances.empty() && r.paths.empty() && !r.hasReturnValue)) ++failures;
            }
        });
    for (auto& th : threads) th.join();
    EXPECT_EQ(failures.load(), 0);
    EXPECT_EQ(host->stats().liveObjects, 0);
    EXPECT_EQ(factoryCalls() - before, 2u);  // the instance and association MIs, once each
}

TEST(HostLoading, MissingLibrariesAndFactoriesAreReported) {
    std::string reg = tempFile("reg") + ".reg";
    {
        std::ofstream out(reg);
        out << "[IPIFTEST_Widget]\nprovider: IpifTestWidget\nlocation: IpifNoSuchLibrary\ntype: instance\n"
               "[IPIFTEST_Gadget]\nprovider: Misnamed\nlocation: IpifTestGadget\ntype: instance\n";
    }
    HostOptions o = testHostOptions();
    o.regPaths = {reg};
    Host host(o);
    Result missing = host.enumerateInstanceNames("root/cimv2", "IPIFTEST_Widget");
    EXPECT_EQ(missing.rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(missing.message.rfind("cannot find provider library libIpifNoSuchLibrary.so", 0), 0u) << missing.message;
    Result misnamed = host.enumerateInstanceNames("root/cimv2", "IPIFTEST_Gadget");
    EXPECT_EQ(misnamed.message, "provider library libIpifTestGadget.so has no Misnamed_Create_InstanceMI");
    std::remove(reg.c_str());

    o = testHostOptions();
    o.mofPaths = {IPIF_HOST_TEST_DIR "/nowhere.mof"};
    EXPECT_THROW(Host{o}, MofError);
}

TEST(HostLoading, StrictPropertiesHoldProvidersToTheirClasses) {
    HostOptions o = testHostOptions();
    o.strictProperties = true;
    Host host(o);
    const CMPIBroker* b = host.broker();
    CMPIInstance* inst = CMNewInstance(b, CMNewObjectPath(b, "root/cimv2", "IPIFTEST_Widget", NULL), NULL);
    CMPIUint32 wide = 1;
    EXPECT_EQ(CMSetProperty(inst, "Size", &wide, CMPI_uint32).rc, CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(CMSetProperty(inst, "Colour", "red", CMPI_chars).rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    CMPIUint16 narrow = 1;
    EXPECT_EQ(CMSetProperty(inst, "Size", &narrow, CMPI_uint16).rc, CMPI_RC_OK);
    // The test providers keep to their classes.
    EXPECT_EQ(host.enumerateInstances("root/cimv2", "IPIFTEST_Element").instances.size(), 3u);
}
