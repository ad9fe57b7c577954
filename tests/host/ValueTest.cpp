// Object path text and command-line values: printing, parsing, typing.
#include <gtest/gtest.h>

#include "HostTestSupport.h"
#include "ipif/Mof.h"

using namespace ipif;

namespace {

ClassRepository testClasses() {
    ClassRepository repo;
    repo.addFile(IPIF_HOST_TEST_DIR "/test.mof");
    repo.resolve();
    return repo;
}

}  // namespace

TEST(PathText, NestedReferencesWithAwkwardValuesRoundTrip) {
    ObjectPath gadget("root/cimv2", "IPIFTEST_Gadget");
    gadget.keys.set("Name", Value::string("g,2=\"x\"\\"));
    gadget.keys.set("Slot", Value::uint32(2));
    ObjectPath widget = widgetPath("w\"2\\x,Slot=9");
    ObjectPath link("root/cimv2", "IPIFTEST_WidgetGadget");
    link.keys.set("Widget", Value::reference(widget));
    link.keys.set("Gadget", Value::reference(gadget));

    EXPECT_EQ(gadget.toString(), "root/cimv2:IPIFTEST_Gadget.Name=\"g,2=\\\"x\\\"\\\\\",Slot=2");
    std::string text = link.toString();
    EXPECT_EQ(text.rfind("root/cimv2:IPIFTEST_WidgetGadget.Widget=\"root/cimv2:IPIFTEST_Widget.InstanceID=", 0), 0u)
        << text;

    // Read back, the references come as text until the class declarations type them.
    ObjectPath parsed = ObjectPath::parse(text);
    ASSERT_EQ(parsed.keys.size(), 2u);
    EXPECT_EQ(parsed.keys.find("Widget")->type(), CimType::String);
    ObjectPath typed = testClasses().typedPath(parsed);
    EXPECT_EQ(typed, link);
    EXPECT_EQ(typed.keys.find("gadget")->asReference().keys.find("Slot")->type(), CimType::Uint32);
    EXPECT_EQ(typed.toString(), text);

    // A path holding a reference whose own key is a reference: two levels of escaping.
    ObjectPath outer("", "IPIFTEST_WidgetGadget");
    outer.keys.set("Widget", Value::reference(link));
    EXPECT_EQ(ObjectPath::parse(outer.toString()).keys.find("Widget")->asString(), text);
}

TEST(PathText, ParsingRulesAndRejections) {
    ObjectPath p = ObjectPath::parse("IPIFTEST_Gadget.Name=\"a:b.c\",Slot=010");
    EXPECT_EQ(p.nameSpace, "");
    EXPECT_EQ(p.keys.find("Name")->asString(), "a:b.c");
    EXPECT_EQ(p.keys.find("Slot")->asUnsigned(), 10u);  // decimal, not octal

    p = ObjectPath::parse("root/test:X.a=-3,b=TRUE,c=bare_word,d=0x1f,e=2.5");
    EXPECT_EQ(p.nameSpace, "root/test");
    EXPECT_EQ(p.keys.find("a")->asSigned(), -3);
    EXPECT_TRUE(p.keys.find("B")->asBool());
    EXPECT_EQ(p.keys.find("c")->asString(), "bare_word");
    EXPECT_EQ(p.keys.find("d")->asUnsigned(), 31u);
    EXPECT_DOUBLE_EQ(p.keys.find("e")->asReal(), 2.5);
    EXPECT_TRUE(ObjectPath::parse("root/cimv2:X").keys.empty());

    for (const char* bad : {"", ".k=1", "X.", "X.k", "X.k=", "X.k=\"open", "X.k=1,", "X.k=1,k=2", "X.k=a b",
                            "1X", ":X", "X.k=\"a\"b", "X,k=1", "ns :X", "X.k=a\"b"})
        EXPECT_THROW(ObjectPath::parse(bad), ParseError) << bad;
}

TEST(PathText, TypingFollowsTheClassDeclarations) {
    ClassRepository repo = testClasses();
    ObjectPath typed = repo.typedPath(ObjectPath::parse("IPIFTEST_Gadget.name=123,SLOT=\"7\""));
    EXPECT_EQ(typed.keys.find("Name")->asString(), "123");
    EXPECT_EQ(typed.keys.find("Slot")->asUnsigned(), 7u);
    EXPECT_EQ(typed.keys.at(0).first, "Name");  // declared spelling

    auto rcOf = [&](const char* text) {
        try {
            repo.typedPath(ObjectPath::parse(text));
        } catch (const CimError& e) {
            return e.rc();
        }
        return 0;
    };
    EXPECT_EQ(rcOf("IPIFTEST_Nope.Name=\"x\""), 5);
    EXPECT_EQ(rcOf("IPIFTEST_Gadget.Colour=\"x\""), 12);
    EXPECT_EQ(rcOf("IPIFTEST_Gadget.Slot=-1"), 4);
    EXPECT_EQ(rcOf("IPIFTEST_Gadget.Slot=4294967296"), 4);
    EXPECT_EQ(rcOf("IPIFTEST_WidgetGadget.Widget=\"not a path\""), 4);
    EXPECT_EQ(rcOf("IPIFTEST_WidgetGadget.Widget=\"IPIFTEST_Widget.Bogus=1\""), 12);
}

TEST(ValueText, CommandLineLiteralsAndTheirMofForm) {
    Value tags = Value::parse(CimType::String, true, "{a, \"b,c\", \"q\\\"d\"}");
    ASSERT_EQ(tags.size(), 3u);
    EXPECT_EQ(std::get<std::string>(tags.elements()[1]), "b,c");
    EXPECT_EQ(std::get<std::string>(tags.elements()[2]), "q\"d");
    EXPECT_EQ(tags.toText(), "{\"a\", \"b,c\", \"q\\\"d\"}");
    EXPECT_EQ(Value::parse(CimType::Uint16, true, "").size(), 0u);
    EXPECT_EQ(Value::parse(CimType::Uint16, true, "2,3, 11").toText(), "{2, 3, 11}");

    EXPECT_EQ(Value::parse(CimType::Uint8, false, "255").asUnsigned(), 255u);
    EXPECT_THROW(Value::parse(CimType::Uint8, false, "256"), ParseError);
    EXPECT_THROW(Value::parse(CimType::Sint8, false, "-129"), ParseError);
    EXPECT_THROW(Value::parse(CimType::Uint32, false, "-1"), ParseError);
    EXPECT_THROW(Value::parse(CimType::Uint32, false, "12abc"), ParseError);
    EXPECT_EQ(Value::parse(CimType::Sint64, false, "-9223372036854775808").asSigned(), INT64_MIN);
    EXPECT_TRUE(Value::parse(CimType::Boolean, false, "TRUE").asBool());
    EXPECT_THROW(Value::parse(CimType::Boolean, false, "yes"), ParseError);
    EXPECT_EQ(Value::parse(CimType::String, false, "\"quoted \\\"x\\\"\"").asString(), "quoted \"x\"");
    EXPECT_EQ(Value::parse(CimType::String, false, "plain \"x\"").asString(), "plain \"x\"");

    EXPECT_EQ(Value::parse(CimType::DateTime, false, "00000000000100.000000:000").asString(),
              "00000000000100.000000:000");
    EXPECT_THROW(Value::parse(CimType::DateTime, false, "00000000000100.000000"), ParseError);
    EXPECT_THROW(Value::parse(CimType::DateTime, false, "20240101000000.000000x000"), ParseError);

    Value ref = Value::parse(CimType::Reference, false, "IPIFTEST_Gadget.Name=\"g1\",Slot=1");
    EXPECT_EQ(ref.asReference().className, "IPIFTEST_Gadget");
    EXPECT_EQ(ref.toText(), "\"IPIFTEST_Gadget.Name=\\\"g1\\\",Slot=1\"");

    EXPECT_EQ(Value::boolean(false).toText(), "false");
    EXPECT_EQ(Value::null(CimType::Uint16).toText(), "NULL");
    EXPECT_EQ(Value::string("a\nb").toText(), "\"a\\nb\"");
    EXPECT_NE(Value::uint16(3), Value::uint32(3));  // the type is part of the value
    EXPECT_THROW(Value::uint8(7).asSigned(), std::logic_error);
}
