// Chains of effects as the hosts write them, and running them on pixels:
//
//   brightness --level 13 , contrast --level 12 , vintage --ellipse 300,200,120,80
//
// Each step is an effect name followed by its parameters (--name value or --name=value) and its
// selection (--rect, --ellipse, --mask); steps are separated by a lone ",". The tool reads the
// words from its command line, the other hosts from one string (split_words). Options that are
// neither parameters nor selections go to the host (the tool's --out-dir, -j, ...); words that
// are not options are kept for the host too (the tool's file names).
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "catalog/effects.h"
#include "catalog/params.h"
#include "catalog/selection.h"

namespace fxcat {

// A lone "," separates steps: shells pass it through unquoted and unexpanded, and no parameter
// value, selection or file name is ever exactly ",".
constexpr std::string_view kStepSeparator = ",";

// Options the hosts keep for themselves; no effect parameter may take one of these names (the
// catalogue checks its table against them when it is compiled).
inline constexpr const char* kHostOptions[] = {
    "mask", "rect", "ellipse", "out-dir",  "progress",    "help",
    "jobs", "j",    "quality", "strip",    "auto-orient", "max-pixels",
    "only", "o",    "version", "lossless", "format",      "h"};

struct Step {
  const Effect* effect = nullptr;
  Settings settings;
  // --rect and --ellipse as parsed. --mask FILE is left to the host, which reads the file and
  // fills selection.mask before the chain runs (mask_path says which file was named).
  SelectionRequest selection;
  std::string mask_path;
  // Words of the step that are not options: the tool's file names. Other hosts refuse them.
  std::vector<std::string> positional;
};

// An option word: "--level=3" is {name "level", value "3"}, "-j" is {name "j"}.
struct Option {
  std::string word;  // as written
  std::string name;  // without dashes or value
  std::string value;
  bool has_value = false;  // the word had "=value", or Words::take_value found one
};

Option split_option(const std::string& word);

// The words of a command line, read one at a time.
class Words {
 public:
  explicit Words(std::span<const std::string> words) : words_(words) {}
  bool done() const { return pos_ >= words_.size(); }
  const std::string& peek() const { return words_[pos_]; }
  const std::string& next() { return words_[pos_++]; }
  // The value of an option that needs one: after '=', else the next word unless that is a step
  // separator. False when there is none.
  bool take_value(Option& option);

 private:
  std::span<const std::string> words_;
  size_t pos_ = 0;
};

// What a host adds to the chain's language.
class ChainHost {
 public:
  virtual ~ChainHost() = default;
  // Offered each option that is neither a parameter of its step's effect nor a selection.
  // Returns false when the option is not the host's either. When it takes the option it reads
  // any value with words.take_value(option), and sets `error` when the option is malformed.
  virtual bool option(size_t step, Option& option, Words& words, std::string& error) = 0;
  // Appended to "unknown effect 'x'": where the user finds the names.
  virtual std::string effects_hint() const { return {}; }
};

// Splits a chain written as one string into its words at white space. A ',' standing apart
// from the words after it ("13, contrast" or "13 ,contrast") becomes a separator of its own,
// while one inside a word ("--rect 1,2,3,4") stays.
std::vector<std::string> split_words(std::string_view text);

// Parses the words into steps (at least one). `host` may be null: every option then belongs to
// a step. Errors name the step when there is more than one.
std::string parse_chain(std::span<const std::string> words, ChainHost* host,
                        std::vector<Step>& steps);

// "step 2 (contrast): " when the chain has more than one step, else "".
std::string step_label(std::span<const Step> steps, size_t index);

// Runs the steps in order on `pixels` (width x height), each resolving its parameters and its
// selection against the picture it receives, in place where the step allows and through a
// second buffer where it does not (or when it changes the size). On failure the pixels are
// those of the last step that ran.
std::string run_chain(std::span<const Step> steps, Pixels& pixels, int32_t& width, int32_t& height);

}  // namespace fxcat
