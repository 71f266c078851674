// Scripts the tools that the library runs: which calls are expected, what they print, how they end. At its end every
// expected call was made and no other, or the test fails.
#ifndef TESTS_SUPPORT_SCENARIO_H
#define TESTS_SUPPORT_SCENARIO_H

#include "support/test.h"

namespace test {

class ScriptedCall {
  public:
    explicit ScriptedCall(std::filesystem::path path) : path_(std::move(path)) {}

    ScriptedCall &Prints(std::string_view text);
    ScriptedCall &Exits(int status);
    ScriptedCall &DiesOf(int signal);
    ScriptedCall &Times(int count);
    ScriptedCall &AnyTimes();                     // never, once or often, at any moment
    ScriptedCall &Runs(std::string_view script);  // "#!/bin/sh ...": an effect of the tool; gets the call's arguments

  private:
    std::filesystem::path path_;
};

class Scenario {
  public:
    Scenario();   // empty: any call of a scripted tool fails the test
    ~Scenario();  // fails the test when an expected call is missing or another one came
    Scenario(const Scenario &) = delete;
    Scenario &operator=(const Scenario &) = delete;

    // The whole argument vector, beginning with the tool as the library names it ("/sbin/mdadm", "pvs").
    ScriptedCall Expect(const std::vector<std::string> &words);
    ScriptedCall ExpectAny(const std::string &tool);  // with any arguments
    void InAnyOrder();

    // The calls so far, one quoted line each ("/sbin/mdadm -E /dev/sda3"), expected or not.
    static std::vector<std::string> Calls();
    // Returns the differences from the script; empty when there are none. Resets them, so that the destructor does not
    // report them again.
    std::string Finish();
};

}  // namespace test

#endif
