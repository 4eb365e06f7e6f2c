// Parsing chains of effects and running them.
#include "catalog/chain.h"

#include <cctype>
#include <string>
#include <utility>

namespace fxcat {
namespace {

bool is_separator(std::string_view word) { return word == kStepSeparator; }

// A word made only of punctuation that people use between commands ("+", ";", "|", "->"):
// never an image file (its format comes from an extension), so most likely a separator that is
// not ours.
bool looks_like_separator(std::string_view word) {
  if (word.empty()) return false;
  for (char c : word) {
    if (std::string_view(",;:|+&>=-").find(c) == std::string_view::npos) return false;
  }
  return true;
}

constexpr const char* kSeparatorHint = " (steps are separated by a lone ',')";

std::string step_name(size_t index, const Step& step) {
  return "step " + std::to_string(index + 1) +
         (step.effect != nullptr ? std::string(" (") + step.effect->name + ")" : std::string());
}

// Parses one step's words after its effect name.
std::string parse_step(size_t index, Step& step, Words& words, ChainHost* host) {
  bool options_done = false;
  while (!words.done() && (options_done || !is_separator(words.peek()))) {
    const std::string& word = words.next();
    if (options_done || word.size() < 2 || word[0] != '-') {
      if (!options_done && looks_like_separator(word)) {
        return "'" + word + "' does not separate steps" + kSeparatorHint;
      }
      step.positional.push_back(word);
      continue;
    }
    if (word == "--") {
      options_done = true;
      continue;
    }
    Option opt = split_option(word);
    const Effect& e = *step.effect;
    bool is_param = false;
    for (size_t k = 0; k < e.param_count(); ++k)
      is_param = is_param || opt.name == e.params[k].name;
    const bool long_form = word.rfind("--", 0) == 0;
    const bool is_shape =
        long_form && (opt.name == "rect" || opt.name == "ellipse" || opt.name == "mask");
    if (!(long_form && is_param) && !is_shape) {
      std::string err;
      if (host != nullptr && host->option(index, opt, words, err)) {
        if (!err.empty()) return err;
        continue;
      }
      if (!long_form) return "unknown option " + word;
    }
    if (!words.take_value(opt)) return "--" + opt.name + " needs a value";
    SelectionRequest& s = step.selection;
    if (opt.name == "rect") {
      if (s.has_rect) return "--rect is given twice";
      s.has_rect = true;
      if (std::string err = parse_rect(opt.value, s.rect); !err.empty()) return err;
    } else if (opt.name == "ellipse") {
      if (s.has_ellipse) return "--ellipse is given twice";
      s.has_ellipse = true;
      if (std::string err = parse_ellipse(opt.value, s.ellipse); !err.empty()) return err;
    } else if (opt.name == "mask") {
      if (!step.mask_path.empty()) return "--mask is given twice";
      if (opt.value.empty()) return "--mask needs a file";
      step.mask_path = opt.value;
    } else if (std::string err = set_param(e, opt.name, opt.value, step.settings); !err.empty()) {
      if (!opt.value.empty() && opt.value.back() == ',') err += kSeparatorHint;
      return err;
    }
  }
  return {};
}

}  // namespace

Option split_option(const std::string& word) {
  Option o;
  o.word = word;
  const size_t start = word.rfind("--", 0) == 0 ? 2 : 1;
  const size_t eq = word.find('=');
  o.name = word.substr(start, eq == std::string::npos ? std::string::npos : eq - start);
  if (eq != std::string::npos) {
    o.value = word.substr(eq + 1);
    o.has_value = true;
  }
  return o;
}

bool Words::take_value(Option& option) {
  if (option.has_value) return true;
  if (done() || is_separator(peek())) return false;
  option.value = next();
  option.has_value = true;
  return true;
}

std::vector<std::string> split_words(std::string_view text) {
  std::vector<std::string> words;
  const auto space = [](char c) { return std::isspace(static_cast<unsigned char>(c)) != 0; };
  size_t i = 0;
  while (i < text.size()) {
    if (space(text[i])) {
      ++i;
      continue;
    }
    size_t end = i;
    while (end < text.size() && !space(text[end])) ++end;
    std::string_view word = text.substr(i, end - i);
    i = end;
    // ", contrast" and "13, contrast" and "13 ,contrast": the comma stands apart.
    const bool lead = word.size() > 1 && word.front() == ',';
    if (lead) word.remove_prefix(1);
    const bool trail = word.size() > 1 && word.back() == ',';
    if (trail) word.remove_suffix(1);
    if (lead) words.emplace_back(kStepSeparator);
    words.emplace_back(word);
    if (trail) words.emplace_back(kStepSeparator);
  }
  return words;
}

std::string step_label(std::span<const Step> steps, size_t index) {
  if (steps.size() < 2) return {};
  return step_name(index, steps[index]) + ": ";
}

std::string parse_chain(std::span<const std::string> words, ChainHost* host,
                        std::vector<Step>& steps) {
  steps.clear();
  size_t count = 1;  // for the labels, known before the first error
  for (const std::string& w : words) {
    if (w == "--") break;
    if (is_separator(w)) ++count;
  }
  const auto label = [&](size_t index, const Step& step) {
    return count < 2 ? std::string() : step_name(index, step) + ": ";
  };
  Words cursor(words);
  while (true) {
    Step step;
    const size_t index = steps.size();
    // Host options may come before the effect's name.
    while (!cursor.done() && !is_separator(cursor.peek()) && cursor.peek().size() > 1 &&
           cursor.peek()[0] == '-') {
      Option opt = split_option(cursor.next());
      std::string err;
      if (host == nullptr || !host->option(index, opt, cursor, err)) {
        return label(index, step) + "a step begins with an effect name, not " + opt.word;
      }
      if (!err.empty()) return label(index, step) + err;
    }
    if (cursor.done() || is_separator(cursor.peek())) {
      if (count < 2) return "no effect given";
      return step_name(index, step) + " is empty" + kSeparatorHint;
    }
    const std::string& name = cursor.next();
    step.effect = find_effect(name);
    if (step.effect == nullptr) {
      std::string err = "unknown effect '" + name + "'";
      if (!name.empty() && name.back() == ',') err += kSeparatorHint;
      if (host != nullptr) err += host->effects_hint();
      return label(index, step) + err;
    }
    if (std::string err = parse_step(index, step, cursor, host); !err.empty()) {
      return label(index, step) + err;
    }
    steps.push_back(std::move(step));
    if (cursor.done()) break;
    cursor.next();  // the separator
    if (cursor.done()) return step_name(index + 1, Step{}) + " is empty" + kSeparatorHint;
  }
  return {};
}

std::string run_chain(std::span<const Step> steps, Pixels& pixels, int32_t& width,
                      int32_t& height) {
  for (size_t i = 0; i < steps.size(); ++i) {
    const Step& step = steps[i];
    const Effect& effect = *step.effect;
    const std::string label = step_label(steps, i);
    Values values;
    if (std::string err = resolve(effect, step.settings, width, height, values); !err.empty()) {
      return label + err;
    }
    Selection selection;
    const bool selected = step.selection.any();
    if (selected && effect.selects == Selects::kNothing) {
      return label + effect.name + " takes no selection (it changes the image's size)";
    }
    if (selected) {
      if (std::string err = make_selection(step.selection, width, height, selection);
          !err.empty()) {
        return label + err;
      }
    }
    // Errors from the library name the effect even in a chain of one.
    const std::string run_label = label.empty() ? std::string(effect.name) + ": " : label;
    int32_t out_width = 0, out_height = 0;
    if (std::string err = output_size(effect, values, width, height, out_width, out_height);
        !err.empty()) {
      return run_label + err;
    }
    const Selection* sel = selected ? &selection : nullptr;
    if (!needs_two_buffers(effect, selected)) {
      if (std::string err =
              run_effect(effect, values, pixels.data(), width, height, pixels.data(), sel);
          !err.empty()) {
        return run_label + err;
      }
      continue;
    }
    Pixels out(static_cast<size_t>(out_width) * static_cast<size_t>(out_height));
    if (std::string err = run_effect(effect, values, pixels.data(), width, height, out.data(), sel);
        !err.empty()) {
      return run_label + err;
    }
    pixels.swap(out);
    width = out_width;
    height = out_height;
  }
  return {};
}

}  // namespace fxcat
