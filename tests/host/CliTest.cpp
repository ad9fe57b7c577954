// The ipif binary over the test providers: output formats, typing of values, error lines and
// exit codes.
#include <gtest/gtest.h>

#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <fstream>
#include <sstream>

#include "HostTestSupport.h"

namespace {

struct Outcome {
    int exit = -1;       // exit status, or -1 when killed by a signal
    std::string out;
    std::string err;
};

std::string shellQuote(const std::string& s) {
    std::string q = "'";
    for (char c : s) q += c == '\'' ? std::string("'\\''") : std::string(1, c);
    return q + "'";
}

std::string slurp(const std::string& path) {
    std::ifstream in(path);
    std::stringstream ss;
    ss << in.rdbuf();
    return ss.str();
}

void writeFile(const std::string& path, const std::string& text) { std::ofstream(path) << text; }

// Runs ipif over the test MOF and providers (unless raw: the project's MOF and providers) with
// the given arguments and environment assignments.
Outcome runIpif(const std::vector<std::string>& args, bool raw = false, const std::string& env = "") {
    std::string base = testing::TempDir() + "/ipif-cli-" + std::to_string(getpid());
    std::string cmd = env + " IPIF_PROVIDER_PATH=" + shellQuote(IPIF_TEST_PROVIDER_DIR) + " " + shellQuote(IPIF_CLI);
    if (!raw)
        cmd += " --mof " + shellQuote(IPIF_HOST_TEST_DIR "/test.mof") + " --reg " +
               shellQuote(IPIF_HOST_TEST_DIR "/test.reg");
    for (const auto& a : args) cmd += " " + shellQuote(a);
    cmd += " >" + base + ".out 2>" + base + ".err";
    int status = std::system(cmd.c_str());
    Outcome r;
    if (WIFEXITED(status)) r.exit = WEXITSTATUS(status);
    r.out = slurp(base + ".out");
    r.err = slurp(base + ".err");
    std::remove((base + ".out").c_str());
    std::remove((base + ".err").c_str());
    return r;
}

const char* kW1 = "IPIFTEST_Widget.InstanceID=\"w1\"";

int lines(const std::string& s) {
    int n = 0;
    for (char c : s) n += c == '\n';
    return n;
}

}  // namespace

TEST(Cli, InstancesPathsAndMethodResultsInBothFormats) {
    Outcome ei = runIpif({"ei", "IPIFTEST_Widget"});
    ASSERT_EQ(ei.exit, 0) << ei.err;
    EXPECT_EQ(ei.err, "");
    EXPECT_EQ(ei.out.rfind("instance of IPIFTEST_Widget {\n    InstanceID = \"w1\";\n    ElementName = \"first\";\n"
                           "    Size = 10;\n    Tags = {\"a\", \"b,c\"};\n    Created = \"20240102030405.000006+060\";\n"
                           "    Enabled = true;\n    Offset = -5;\n    Ratio = 0.5;\n};\n\ninstance of",
                           0),
              0u)
        << ei.out;
    EXPECT_NE(ei.out.find("    ElementName = \"awkward, \\\"one\\\"\";\n"), std::string::npos);

    Outcome ein = runIpif({"ein", "root/cimv2:IPIFTEST_Widget"});
    EXPECT_EQ(ein.out,
              "root/cimv2:IPIFTEST_Widget.InstanceID=\"w1\"\n"
              "root/cimv2:IPIFTEST_Widget.InstanceID=\"w\\\"2\\\\x\"\n");
    // A printed path works as input.
    Outcome gi = runIpif({"gi", ein.out.substr(ein.out.find('\n') + 1, ein.out.size() - ein.out.find('\n') - 2)});
    EXPECT_EQ(gi.exit, 0) << gi.err;
    EXPECT_NE(gi.out.find("Size = 20;"), std::string::npos);

    Outcome json = runIpif({"--json", "gi", kW1});
    ASSERT_EQ(json.exit, 0) << json.err;
    EXPECT_EQ(json.out.rfind("[{\"class\": \"IPIFTEST_Widget\", \"path\": \"root/cimv2:IPIFTEST_Widget.InstanceID=\\\"w1\\\"\", "
                             "\"properties\": {\"InstanceID\": \"w1\", \"ElementName\": \"first\", \"Size\": 10, "
                             "\"Tags\": [\"a\", \"b,c\"], ",
                             0),
              0u)
        << json.out;
    EXPECT_NE(json.out.find("\"Enabled\": true, \"Offset\": -5, \"Ratio\": 0.5}}]"), std::string::npos);

    Outcome cm = runIpif({"cm", kW1, "Resize", "NewSize=12", "Gadget=IPIFTEST_Gadget.Name=\"g,2=\\\"x\\\"\",Slot=2"});
    ASSERT_EQ(cm.exit, 0) << cm.err;
    EXPECT_EQ(cm.out,
              "ReturnValue = 0;\n"
              "Gadget = \"IPIFTEST_Gadget.Name=\\\"g,2=\\\\\\\"x\\\\\\\"\\\",Slot=2\";\n"
              "Log = {\"resized\", \"w1\"};\n");
    Outcome cmJson = runIpif({"--json", "cm", kW1, "Resize", "NewSize=10"});
    EXPECT_EQ(cmJson.out,
              "{\"ReturnValue\": 0, \"outArgs\": {\"Gadget\": \"root/cimv2:IPIFTEST_Gadget.Name=\\\"made\\\",Slot=7\", "
              "\"Log\": [\"resized\", \"w1\"]}}\n");
}

TEST(Cli, AssociationFiltersAndPassedOnOperations) {
    EXPECT_EQ(lines(runIpif({"ain", kW1}).out), 2);
    EXPECT_EQ(lines(runIpif({"ain", kW1, "-ac", "IPIFTEST_WidgetGadget", "-rc", "IPIFTEST_Gadget"}).out), 2);
    EXPECT_EQ(runIpif({"ain", kW1, "-rc", "IPIFTEST_Widget"}).out, "");
    EXPECT_EQ(runIpif({"ain", kW1, "-r", "Gadget"}).out, "");
    Outcome ai = runIpif({"ai", "IPIFTEST_Gadget.Name=\"g3\",Slot=3"});
    EXPECT_EQ(ai.out.rfind("instance of IPIFTEST_Widget {\n    InstanceID = \"w\\\"2\\\\x\";", 0), 0u) << ai.out;
    Outcome ri = runIpif({"ri", kW1, "-rc", "IPIFTEST_WidgetGadget", "-r", "Widget"});
    EXPECT_NE(ri.out.find("    Weight = 20;\n"), std::string::npos) << ri.out;
    EXPECT_EQ(lines(runIpif({"rin", kW1}).out), 2);

    Outcome ci = runIpif({"ci", "IPIFTEST_Widget.InstanceID=\"cli\"", "ElementName=made by cli"});
    ASSERT_EQ(ci.exit, 0) << ci.err;
    EXPECT_EQ(ci.out, "root/cimv2:IPIFTEST_Widget.InstanceID=\"cli\"\n");
    // Each run is its own process: the created widget is gone again, so delete fails.
    Outcome di = runIpif({"di", "IPIFTEST_Widget.InstanceID=\"cli\""});
    EXPECT_EQ(di.exit, 2);
    EXPECT_EQ(di.err, "ipif: error: rc 6 (CMPI_RC_ERR_NOT_FOUND)\n");
    EXPECT_EQ(lines(runIpif({"eq", "IPIFTEST_Widget", "ElementName = 'first'"}).out), 10);

    Outcome mi = runIpif({"mi", kW1, "Size=33", "ElementName=renamed"});
    EXPECT_EQ(mi.exit, 0) << mi.err;
    EXPECT_EQ(mi.out, "");
    // The explicit type reaches the provider unchanged, and it refuses it.
    Outcome typed = runIpif({"mi", kW1, "Size:uint32=5"});
    EXPECT_EQ(typed.exit, 2);
    EXPECT_EQ(typed.err, "ipif: error: rc 13 (CMPI_RC_ERR_TYPE_MISMATCH): Size must be uint16\n");

    std::string file = testing::TempDir() + "/ipif-cli-spawn-" + std::to_string(getpid());
    std::remove(file.c_str());
    Outcome spawn = runIpif({"cm", kW1, "Spawn", "Millis=300", "File=" + file});
    EXPECT_EQ(spawn.exit, 0) << spawn.err;
    EXPECT_EQ(slurp(file), "done");  // ipif waited for the provider's thread before exiting
    std::remove(file.c_str());
}

TEST(Cli, ErrorsAreOneLineWithTheirExitCode) {
    struct Case {
        std::vector<std::string> args;
        int exit;
        const char* err;  // prefix of the single stderr line
    } cases[] = {
        {{"gi", "IPIFTEST_Widget.InstanceID=\"w1"}, 1, "ipif: error: rc 4 (CMPI_RC_ERR_INVALID_PARAMETER): bad object path"},
        {{"ei", "IPIFTEST_Nope"}, 1, "ipif: error: rc 5 (CMPI_RC_ERR_INVALID_CLASS): unknown class IPIFTEST_Nope"},
        {{"gi", "IPIFTEST_Widget.Colour=\"x\""}, 1, "ipif: error: rc 12 (CMPI_RC_ERR_NO_SUCH_PROPERTY): class IPIFTEST_Widget has no property Colour"},
        {{"mi", kW1, "Colour=red"}, 1, "ipif: error: rc 12 (CMPI_RC_ERR_NO_SUCH_PROPERTY)"},
        {{"mi", kW1, "Size=70000"}, 1, "ipif: error: rc 4 (CMPI_RC_ERR_INVALID_PARAMETER): Size: out of range for uint16"},
        {{"cm", kW1, "Resize", "Bogus=1"}, 1, "ipif: error: rc 4 (CMPI_RC_ERR_INVALID_PARAMETER): method IPIFTEST_Widget.Resize has no parameter Bogus"},
        {{"ai", kW1, "-ac", "IPIFTEST_Nope"}, 1, "ipif: error: rc 5 (CMPI_RC_ERR_INVALID_CLASS): unknown class IPIFTEST_Nope (-ac)"},
        {{"gi", "IPIFTEST_Widget.InstanceID=\"none\""}, 2, "ipif: error: rc 6 (CMPI_RC_ERR_NOT_FOUND): no such widget"},
        {{"cm", kW1, "Fail"}, 2, "ipif: error: rc 2 (CMPI_RC_ERR_ACCESS_DENIED): denied\\nby the widget"},
        {{"cm", kW1, "Throw"}, 2, "ipif: error: rc 1 (CMPI_RC_ERR_FAILED): provider threw: widget exploded"},
        {{"mi", kW1, "Size=5000"}, 2, "ipif: error: rc 4 (CMPI_RC_ERR_INVALID_PARAMETER): Size too large"},
        {{"frobnicate", kW1}, 1, "ipif: error: unknown command 'frobnicate'"},
        {{"gi"}, 1, "ipif: error: usage: ipif gi PATH"},
        {{"mi", kW1}, 1, "ipif: error: usage: ipif mi PATH"},
        {{"mi", kW1, "=5"}, 1, "ipif: error: expected Name=value"},
        {{"cm", kW1, "Resize", "NewSize:float=1"}, 1, "ipif: error: unknown type 'float'"},
        {{"ei", "IPIFTEST_Widget.InstanceID=\"w1\""}, 1, "ipif: error: rc 4 (CMPI_RC_ERR_INVALID_PARAMETER): expected a class name"},
        {{"ri", kW1, "-rr", "X"}, 1, "ipif: error: -rr does not apply to ri"},
        {{"--bogus", "ei", "X"}, 1, "ipif: error: unknown option --bogus"},
        {{"ai", kW1, "-ac"}, 1, "ipif: error: option -ac needs a value"},
        {{}, 1, "ipif: error: no command given"},
        {{"cm", kW1, "Deep", "Levels=2"}, 3, "ipif: error: IPIFTEST_Widget.Deep returned 2\n"},
        {{"ein", "root/nope:IPIFTEST_Widget"}, 2, "ipif: error: rc 3 (CMPI_RC_ERR_INVALID_NAMESPACE): unknown namespace root/nope\n"},
        {{"--namespace", "root/nope", "gi", kW1}, 2, "ipif: error: rc 3 (CMPI_RC_ERR_INVALID_NAMESPACE)"},
        {{"ain", std::string("root/nope:") + kW1}, 2, "ipif: error: rc 3 (CMPI_RC_ERR_INVALID_NAMESPACE)"},
        {{"--host-model", "fixture:/nonexistent", "ei", "IPIFTEST_Widget"}, 1,
         "ipif: error: host model: /nonexistent: cannot read the host model fixture"},
        {{"--host-model", "fixture:/", "ei", "IPIFTEST_Widget"}, 1, "ipif: error: host model: /: "},
        {{"--host-model", "bogus", "ei", "IPIFTEST_Widget"}, 1, "ipif: error: host model: unknown host model selector"},
        // Control characters from the command line come back escaped.
        {{"gi\x1b[2J\r"}, 1, "ipif: error: unknown command 'gi\\x1B[2J\\r'"},
        {{"ei", "IPIFTEST_\x7f\nNope\x9b"}, 1, "ipif: error: rc 4 (CMPI_RC_ERR_INVALID_PARAMETER): "},
    };
    for (const auto& c : cases) {
        Outcome r = runIpif(c.args);
        std::string what = c.args.empty() ? "(none)" : c.args[0] + " " + (c.args.size() > 1 ? c.args[1] : "");
        EXPECT_EQ(r.exit, c.exit) << what << ": " << r.err;
        EXPECT_EQ(r.err.rfind(c.err, 0), 0u) << what << ": " << r.err;
        EXPECT_EQ(lines(r.err), 1) << what << ": " << r.err;
        for (unsigned char ch : r.err.substr(0, r.err.size() - 1)) EXPECT_TRUE(ch >= 0x20 && ch < 0x7f) << r.err;
    }

    Outcome loud = runIpif({"ein", "IPIFTEST_Widget"}, false, "IPIF_LOG_FILE=/dev/null IPIF_LOG_LEVEL=loud");
    EXPECT_EQ(loud.exit, 1);
    EXPECT_EQ(loud.err.rfind("ipif: error: IPIF_LOG_LEVEL=\"loud\" is not a level", 0), 0u) << loud.err;
    EXPECT_EQ(loud.out, "");

    // The return value and out arguments still print when the status is an error.
    Outcome partial = runIpif({"cm", kW1, "Resize", "NewSize:uint32=1"});
    EXPECT_EQ(partial.exit, 2);
    EXPECT_EQ(partial.out, "ReturnValue = 4;\n");
    EXPECT_EQ(runIpif({"cm", kW1, "Deep", "Levels=2"}).out, "ReturnValue = 2;\n");

    std::string badModel = testing::TempDir() + "/ipif-cli-bad-" + std::to_string(getpid()) + ".model";
    writeFile(badModel, "node 40 host\n  97 strin x\n");
    Outcome model = runIpif({"ein", "IPIFTEST_Widget"}, false, "IPIF_HOST_MODEL=fixture:" + shellQuote(badModel));
    EXPECT_EQ(model.exit, 1);
    EXPECT_EQ(model.err.rfind("ipif: error: host model: /", 0), 0u) << model.err;
    EXPECT_NE(model.err.find(".model:2: unknown property kind \"strin\""), std::string::npos) << model.err;
    EXPECT_EQ(model.out, "");
    std::remove(badModel.c_str());

    Outcome help = runIpif({"--help"}, true);
    EXPECT_EQ(help.exit, 0);
    for (const char* cmd : {"ein", "ei", "gi", "mi", "ci", "di", "eq", "ai", "ain", "ri", "rin", "cm", "--host-model"})
        EXPECT_NE(help.out.find(std::string("  ") + cmd), std::string::npos) << cmd;

    std::string bad = testing::TempDir() + "/ipif-cli-bad-" + std::to_string(getpid()) + ".mof";
    {
        std::ofstream out(bad);
        out << "class A {\n  string x\n};\n";
    }
    Outcome mof = runIpif({"--mof", bad, "ei", "A"}, true);
    EXPECT_EQ(mof.exit, 1);
    EXPECT_EQ(mof.err, "ipif: error: " + bad + ":3: expected ';', found '}'\n");
    std::remove(bad.c_str());
}

TEST(Cli, OddInputNeverCrashes) {
    const std::vector<std::vector<std::string>> inputs = {
        {"gi", ""}, {"gi", "."}, {"gi", ":"}, {"gi", "root/cimv2:"}, {"gi", "IPIFTEST_Widget.InstanceID=\"\\"},
        {"cm", kW1}, {"cm", kW1, ""}, {"cm", kW1, "Resize", "Gadget=IPIFTEST_Nope.X=1"},
        {"cm", kW1, "Resize", "Gadget=\"unterminated"}, {"cm", kW1, "Resize", "NewSize=\"\""},
        {"mi", kW1, "Tags={\"a,b"}, {"mi", kW1, "Created=yesterday"}, {"ein", ""}, {"ein", "::"},
        {"ai", "IPIFTEST_WidgetGadget.Widget=\"IPIFTEST_Widget.InstanceID=\\\"w1\\\"\",Gadget=\"x\""},
        {"--json", "ri", "IPIFTEST_Gadget.Name=\"\",Slot=0"}, {"eq", "IPIFTEST_Widget", ""},
        {"--namespace", "root/none", "ei", "IPIFTEST_Widget"}, {"--reg", "/nonexistent", "ei", "IPIFTEST_Widget"},
        {std::string(5000, 'x')}, {"gi", std::string(5000, '"')},
    };
    for (const auto& args : inputs) {
        Outcome r = runIpif(args);
        EXPECT_TRUE(r.exit == 0 || r.exit == 1 || r.exit == 2) << args[0] << " " << (args.size() > 1 ? args[1] : "");
        EXPECT_LE(lines(r.err), 1) << r.err;
    }
}

// A host whose interface name holds an invalid UTF-8 byte, terminal controls, an escaped newline
// and a valid two-byte character: text output escapes what is not printable, JSON stays valid.
TEST(Cli, OddBytesInNamesAreEscaped) {
    const std::string odd = "e\xff\x1b]0;x\x07\\n\xc3\xbc";  // the fixture's quoted spelling
    std::string model = testing::TempDir() + "/ipif-cli-odd-" + std::to_string(getpid()) + ".model";
    writeFile(model, "node 40 host Host\n  97 string h\n  node 12 p0 \"" + odd + "\"\n    108 string \"" + odd +
                         "\"\n    node 29 ip \"" + odd + "\"\n      24 unsigned 3\n      47 unsigned 4096\n"
                         "      96 unsigned 1\n      108 string \"" + odd + "\"\n      123 unsigned 1\n");
    const std::string env = "IPIF_HOST_MODEL=fixture:" + shellQuote(model);
    for (const char* cmd : {"ein", "ei"}) {
        Outcome text = runIpif({cmd, "KVRNX_IPProtocolEndpoint"}, true, env);
        ASSERT_EQ(text.exit, 0) << text.err;
        EXPECT_NE(text.out.find("e\\xFF\\x1B]0;x\\x07\\n\xc3\xbc"), std::string::npos) << text.out;
        for (unsigned char c : text.out) EXPECT_TRUE(c == '\n' || (c >= 0x20 && c != 0x7f)) << cmd << ": " << int(c);
        if (std::string(cmd) == "ein") {
            EXPECT_EQ(lines(text.out), 1) << text.out;
        }

        Outcome json = runIpif({"--json", cmd, "KVRNX_IPProtocolEndpoint"}, true, env);
        ASSERT_EQ(json.exit, 0) << json.err;
        EXPECT_NE(json.out.find("e\\u00ff\\u001b]0;x\\u0007\\n\xc3\xbc"), std::string::npos) << json.out;
        std::string file = model + ".json";
        writeFile(file, json.out);
        std::string check = "python3 -c 'import json, sys\n"
                            "def refuse(name): raise ValueError(name)\n"
                            "json.loads(sys.stdin.buffer.read().decode(\"utf-8\"), parse_constant=refuse)' <" +
                            shellQuote(file);
        EXPECT_EQ(std::system(check.c_str()), 0) << json.out;
        std::remove(file.c_str());
    }
    std::remove(model.c_str());
}
