// "Did you mean": the known word that is next to a wrong one.
#ifndef TAVOCTL_SUGGESTION_H
#define TAVOCTL_SUGGESTION_H

#include <string>
#include <vector>

namespace tavoctl {

// "did you mean anna?", or the other text when no word is near.
std::string DidYouMean(const std::string &word, const std::vector<std::string> &known, const std::string &otherwise);

}  // namespace tavoctl

#endif
