// Values in shell-sourced KEY=value files: quoted so that the shell runs nothing and read back
// exactly as written.
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "Nx/PropertyFile.h"
#include "Nx/String.h"
#include "SupportTestUtil.h"

using namespace supporttest;

namespace {

// Every value that can be written reads back byte for byte, through our reader and through bash;
// sourcing runs none of it.
TEST(PropertyFile, QuotedValuesReadBackAsWrittenAndRunNothing) {
    ScratchDir dir;
    std::string every;
    for (int c = 1; c < 256; ++c) {
        if (c != '\n' && c != '\r') every += static_cast<char>(c);
    }
    const std::vector<std::string> values = {"eth0", "", "fe80::1%eth0", "x$(id)", "q'`id`;s", "'", "''", " a b ",
                                             "\\", "\"", "e\xff", every};
    std::string content, script = "set -e; . \"$1\"";
    for (std::size_t i = 0; i < values.size(); ++i) {
        std::string written;
        ASSERT_TRUE(Nx::quoteValue(values[i], written)) << values[i];
        EXPECT_EQ(written == values[i], Nx::isPlainValue(values[i])) << "plain values stay bare: " << written;
        content += "V" + std::to_string(i) + "=" + written + "\n";
        script += "; printf '%s\\0' \"$V" + std::to_string(i) + "\"";
    }
    const std::string path = dir.file("ifcfg-x");
    ASSERT_TRUE(Nx::File::writeAtomically(path, content));
    ::setenv("IPIF_TEST_SCRIPT", script.c_str(), 1);
    FILE* shell = ::popen(("bash -c \"$IPIF_TEST_SCRIPT\" _ " + path).c_str(), "r");
    ASSERT_NE(shell, nullptr);
    std::string sourced;
    char buffer[4096];
    for (std::size_t n; (n = std::fread(buffer, 1, sizeof buffer, shell)) > 0;) sourced.append(buffer, n);
    EXPECT_EQ(::pclose(shell), 0);
    ::unsetenv("IPIF_TEST_SCRIPT");
    Nx::PropertyFile file{Nx::File::Path(path)};
    ASSERT_TRUE(file.open(1));
    std::string expected;
    for (std::size_t i = 0; i < values.size(); ++i) {
        EXPECT_EQ(Nx::make_string(file.getValue(Nx::make_wstring("V" + std::to_string(i)))), values[i]);
        expected += values[i] + std::string(1, '\0');
    }
    EXPECT_EQ(sourced, expected);

    std::string written = "unchanged";
    for (const std::string& bad : {std::string("a\nb"), std::string("a\rb"), std::string("a\0b", 3)})
        EXPECT_FALSE(Nx::quoteValue(bad, written));
    EXPECT_EQ(written, "unchanged");
    EXPECT_FALSE(Nx::isPlainValue(std::string("a\0b", 3)));
    // The shell's other forms read as the shell reads them; an unclosed quote is kept as it is.
    EXPECT_EQ(Nx::unquoteValue("\"a\\\"b\\$c\\d\"'e'\\ f"), "a\"b$c\\de f");
    EXPECT_EQ(Nx::unquoteValue("'open"), "'open");
}

}  // namespace
