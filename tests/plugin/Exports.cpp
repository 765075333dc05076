// The dynamic symbol table of the built plug-in: the class and the table of blob names, and nothing else.
#include <dlfcn.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <memory>
#include <set>
#include <sstream>
#include <string>
#include <vector>

namespace {

struct Symbol {
  char kind = 0;
  std::string name;
};

/// What nm says of the library's defined dynamic symbols.
std::vector<Symbol> definedSymbols() {
  const std::string command = std::string("'" VESK_NM "' -D -C --defined-only '") + VESK_PLUGIN_LIBRARY + "'";
  std::FILE *pipe = popen(command.c_str(), "r");
  std::string text;
  for (int c; pipe != nullptr && (c = std::fgetc(pipe)) != EOF;) text += static_cast<char>(c);
  EXPECT_TRUE(pipe != nullptr && pclose(pipe) == 0) << command;

  std::vector<Symbol> symbols;
  std::istringstream lines(text);
  for (std::string address, line; lines >> address && std::getline(lines, line);)
    symbols.push_back({line.at(1), line.substr(3)});
  return symbols;
}

TEST(Exports, OnlyTheClassAndTheBlobNames) {
  const std::vector<Symbol> symbols = definedSymbols();
  ASSERT_GT(symbols.size(), 20u);
  for (const Symbol &symbol : symbols)
    EXPECT_TRUE(symbol.name == "blob_names" || symbol.name.starts_with("HIDReportVeskPlugin::")) << symbol.name;
}

TEST(Exports, EverythingThatAHostCalls) {
  std::set<std::string> names;
  char blobNamesKind = 0;
  for (const Symbol &symbol : definedSymbols()) {
    names.insert(symbol.name.substr(0, symbol.name.find_first_of("([")));
    if (symbol.name == "blob_names") blobNamesKind = symbol.kind;
  }
  EXPECT_THAT(blobNamesKind, testing::AnyOf('D', 'R', 'B')) << "blob_names is data with C linkage";
  for (const char *member : {"init",
                             "~HIDReportVeskPlugin",
                             "parseArgs",
                             "parseReport",
                             "reportToObject",
                             "runParser",
                             "argsToConfig",
                             "configParser",
                             "addArrayUint32",
                             "addArrayInt32",
                             "addArrayFloat",
                             "arrayWithUint32Array",
                             "arrayWithInt32Array",
                             "arrayWithFloatArray",
                             "printStrings",
                             "errorLevelToString",
                             "blackBoxOptionToString",
                             "blackBoxOptionToDict",
                             "printOSTResult",
                             "parseVersion",
                             "parseVersionExtended",
                             "parseVeskImage",
                             "parseAdcDumpPacket",
                             "parseAdcDumpConfig",
                             "parseAdcDumpState",
                             "parseBlackBoxSummary",
                             "parseBlackBoxFullReport",
                             "parseBlackBoxConfig",
                             "parseOpenShortTest",
                             "parseOpenShortData",
                             "parserVeskAlgBaselineRequest",
                             "parserNoisyPixelThresholdsRequest",
                             "parseWatchDogReport",
                             "parsePowerModeStats"})
    EXPECT_TRUE(names.contains(std::string("HIDReportVeskPlugin::") + member)) << member;
}

TEST(Exports, LoadedLibraryShowsTheTenBlobNames) {
  const std::unique_ptr<void, int (*)(void *)> library(dlopen(VESK_PLUGIN_LIBRARY, RTLD_NOW | RTLD_LOCAL), dlclose);
  ASSERT_TRUE(library) << dlerror();
  const auto *names = static_cast<const char *const *>(dlsym(library.get(), "blob_names"));
  ASSERT_NE(names, nullptr);
  EXPECT_THAT(std::vector<std::string>(names, names + 10),
              testing::ElementsAre("BLOB_LAFE", "BLOB_LFCL", "BLOB_LPMp", "BLOB_LSPR", "BLOB_LSSp", "BLOB_LSSC",
                                   "BLOB_LSRx", "BLOB_LSPM", "BLOB_LRTC", "BLOB_LSFN"));
  EXPECT_EQ(dlsym(library.get(), "kFourDigits"), nullptr);
}

}  // namespace
