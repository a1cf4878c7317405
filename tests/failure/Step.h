// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "tests/failure/Bench.h"

// One operation of the driver, to be run while something fails.
struct Step {
  // What may become of the two tokens that wait.
  enum class Tokens {
    kStay,   // they are there, whether the operation succeeds or not
    kMove,   // the older one may have made room for a new one, so there are two all the same
    kMayGo,  // the operation is there to drop them, so they may go
    kNone,   // the step has no tokens
  };

  std::string name;
  Tokens tokens = Tokens::kStay;
  std::function<void(Bench&)> prepare;
  // Exactly one call of the driver, and nothing else that allocates. Whether it did what it should.
  std::function<bool(Bench&)> run;
  // Brings the state back before the operation is tried again, where it has to be.
  std::function<void(Bench&)> again = [](Bench&) {};
  // Whether each single host call is to fail; not where there are a thousand of the same kind.
  bool hasFewHostCalls = true;
};

// Every operation that allocates or calls the host, in every state that makes a difference.
const std::vector<Step>& AllSteps();
