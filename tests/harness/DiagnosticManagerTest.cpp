// What the controller sees of a run: result line, end of test, exit code.
#include "harness/DiagnosticManager.h"

#include <gmock/gmock.h>

#include <stdexcept>

#include "harness/Probe.h"
#include "harness/base/CDMException.h"

namespace panelglow {
namespace {

constexpr const char* kRefused = "LogMessage 15 20002 \"\" \"\"\nTestFailed 990520\nEndOfTest\n= 1\n";

CDMException Failure() {
  CDMException failure(20472);
  failure.addMessage(LogOptions::DeviceErrors, 17, "first\nline");
  failure.addMessage(LogOptions::Other, -1, "not logged");
  failure.addMessage(LogOptions::ServiceErrors, 20000, "second");
  return failure;
}

template <class Thrown>
std::function<bool()> Throwing(Thrown thrown) {
  return [thrown]() -> bool { throw thrown; };
}

TEST(DiagnosticManager, WhateverARunEndsWithThereIsOneResultAtMostAndOneEndOfTest) {
  const std::string failureLines =
      "LogMessage 7 17 \"first line\" \"\"\nLogMessage 8 20000 \"second\" \"\"\nTestFailed 020472 \"\"\n";
  const std::string callLines = "LogMessage 8 995174 \"WMI call Set failed.\" \"\"\nTestFailed 995174 \"\"\n";
  static std::runtime_error kept("kept");
  static char noNumber[] = "no number";
  const std::pair<std::function<bool()>, std::string> kCases[] = {
      {[] {
         CDMDiag::ReportFailure("770107");
         return false;
       },
       "ReportFailure 770107\n"},
      {Throwing(Failure()), failureLines},
      {[]() -> bool { throw new CDMException(Failure()); }, failureLines},
      {Throwing(InvalidTmbWMIException("Set")), callLines},
      {[]() -> bool { throw new InvalidTmbWMIException("Set"); }, callLines},
      {Throwing(12), "TestFailed 000012 \"\"\n"},
      {Throwing(std::string("990566")), "TestFailed 990566\n"},
      {Throwing("20472 and more"), "TestFailed 020472 \"\"\n"},
      {Throwing(static_cast<char*>(noNumber)), "TestFailed 000000 \"\"\n"},
      {Throwing(std::out_of_range("too far")), "TestFailed 995205 \"too far\"\n"},
      {Throwing(static_cast<std::exception*>(&kept)), "TestFailed 995205 \"kept\"\n"},
      {Throwing(12L), "TestFailed 990518\n"},
      {Throwing(nullptr), "TestFailed 990518\n"},
  };
  for (const auto& [body, lines] : kCases) {
    EXPECT_EQ((ProbeRun{"-subtest=Probe", body}.Lines()), lines + "EndOfTest\n= 1\n");
  }
}

TEST(DiagnosticManager, ACommandLineThatIsNotAcceptedRunsNothingAndNamesTheFirstBadParameter) {
  const std::tuple<const char*, int, const char*> kCases[] = {
      {"-percent=5", 20003, "-percent"},
      {"-dictionary=maybe", 20003, "-dictionary"},
      {"-ZZ=1 -AA=1", 20003, "-aa"},
      {"=x", 20003, ""},
      {"-debug=", 20004, "-debug"},
      {"-catalog=", 20004, "-catalog"},
      {"-LOUD=1", 20004, "-loud"},
      {"-level=abc", 20005, "-level"},
      {"-level=101", 20005, "-level"},
      {"-level=", 20005, "-level"},
      {"-ratio=1.", 20005, "-ratio"},
      {"-mode=fastest", 20006, "-mode"},
      {"-diagconf=.\\none.ini", 20006, "-diagconf"},
      {"-integratormsgfile=", 20006, "-integratormsgfile"},
      {"-paramfile=.\\some.ini -paramsection=y", 20006, "-paramfile"},
      {"-paramfile=.\\some.ini", 20006, "-paramfile"},
      {"-paramfile=.\\some.ini -paramsection=x", 20005, "-level"},
      {"-paramsection=x", 20006, "-paramsection"},
  };
  ProbeRun run;
  run.body = [] { return CDMDiag::ReportFailure("it ran"), true; };
  run.files[".\\some.ini"] = "[x]\n-level=one\n";
  for (const auto& [words, message, name] : kCases) {
    run.words = "-subtest=Probe " + std::string(words);
    EXPECT_EQ(run.Lines(), "LogMessage 15 " + std::to_string(message) + " \"" + name + "\" \"\"\n" + kRefused)
        << words;
  }
  run.words = "-subtest=Probe -serial=none";
  EXPECT_EQ(run.Lines(), kRefused);
  run.prepare = [](Probe& probe) { probe.Declare("-Section", CDMArgumentType::String, "a", nullptr, true); };
  for (const char* words : {"-subtest=Probe -unknown=1", "-subtest=Probe -section="}) {
    run.words = words;
    EXPECT_EQ(
        run.Lines(),
        std::string("LogMessage 15 20000 \"Mandatory argument -Section is not present in command line\" \"\"\n") +
            kRefused);
  }
}

TEST(DiagnosticManager, AcceptedSpellingsRun) {
  for (const char* words :
       {"-LEVEL=0x0A", "-Level=100", "-mode=FAST", "-Loud=False", "-help=FALSE",
        "-paramfile=", "-DATACOLLECTIONFILE=x", "-locale=de_DE", "-diagconf=.\\look.ini", "-level=7=7 -level=7"}) {
    ProbeRun run{"-SUBTEST=Probe " + std::string(words)};
    run.files[".\\look.ini"] = "";
    EXPECT_EQ(run.Lines(), "EndOfTest\n= 0\n") << words;
  }
}

TEST(DiagnosticManager, ASubtestIsFoundByItsExactNameOnly) {
  for (const char* words : {"", "-subtest=probe", "-subtest=", "-subtest=Other", "-dictionary=yes"}) {
    EXPECT_EQ(ProbeRun{words}.Lines(), "LogMessage 15 20001 \"Probe\" \"\"\nTestFailed 990521\nEndOfTest\n= 1\n");
  }
}

// The usage, from its start, with nothing between its parentheses.
constexpr const char* kUsageStart =
    "Usage:\n\nC:\\suite\\probe.exe [<parameter>]*\nwhere parameter is one of the following:\n"
    "-subtest=<testname>     Name of the test (  )\n";

TEST(DiagnosticManager, TheFirstRequestWithABadValueIsNamedInFixedOrderAndNothingElseHappens) {
  for (const auto& [words, name] : {std::pair{"-catalog=1 -version=2 -description=3 -help=4 -debug=5", "-debug"},
                                    {"-catalog=1 -version=2 -description=3 -help=4 -debug=", "-help"},
                                    {"-catalog=1 -version=2 -description=3 -help=true", "-description"},
                                    {"-catalog=1 -version=2 -dictionary=true", "-version"},
                                    {"-catalog -subtest=Probe", "-catalog"}}) {
    const std::string output = ProbeRun{words}.Output();
    EXPECT_THAT(output,
                ::testing::StartsWith("Invalid value for parameter " + std::string(name) + "\n" + kUsageStart));
    EXPECT_THAT(output, ::testing::EndsWith("if -paramfile is not blank.\n\n= 1"));
  }
}

TEST(DiagnosticManager, ABreakIsNotedForTheSubtestLoggedWithoutOneAndIgnoredBehindTheManager) {
  constexpr const char* kHeard = "panelglow-diags: The request to stop was heard";
  constexpr const char* kWhat =
      ". The run ends at its next step, that of an LED test when the attempt under way is over (the dialog's cancel "
      "button ends it at once), and puts every LED back first.\n";
  const std::string kNothing = ". No subtest is running that it could end.\n";
  const std::string kTwice = " (2 times now)";
  for (const auto& [words, output] :
       {std::pair{"-subtest=Probe", "noted" + std::string(kHeard) + kWhat + kHeard + kTwice + kWhat},
        {"", "LogMessage 6 1 \"\" \"\"\nLogMessage 6 1 \"\" \"\"\n" + std::string(kHeard) + kNothing + kHeard +
                 kTwice + kNothing}}) {
    EXPECT_EQ(InOwnProcess([words = words] {
                platform::sim::Simulation machine(platform::sim::MachineDescription{}, {});
                const char* arguments[] = {"probe", words};
                {
                  DiagnosticManager manager(2, arguments, "", "");
                  Probe probe([] { return true; });
                  manager.RegisterSubtest("Probe", &probe);
                  machine.RaiseConsole(1);
                  machine.RaiseConsole(0);
                  machine.Time().SleepFor(1000);
                }
                machine.RaiseConsole(0);
                machine.Time().SleepFor(1000);
                return machine.Output() + (CDMDiag::IsSignalReceived() ? "noted" : "") + machine.Errors();
              }),
              output);
  }
}

}  // namespace
}  // namespace panelglow
