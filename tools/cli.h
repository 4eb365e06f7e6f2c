// What the tool's commands share: exit codes, messages, and a few file-name helpers.
#pragma once

#include <span>
#include <string>

#include "catalog/effects.h"

namespace fxtool {

constexpr int kDone = 0;
constexpr int kFailed = 1;
constexpr int kUsage = 2;

// One line on stderr: "photofx: MESSAGE". Safe to call from several threads.
void say(const std::string& message);

// Says `message` and returns kUsage.
int usage_error(const std::string& message);

// The usage text `photofx help` prints, within 80 columns.
std::string usage_text();

std::string base_name(const std::string& path);

// Makes `dir` (and its parents) unless it exists.
std::string make_directory(const std::string& dir);

// `photofx apply WORDS...` (apply.cpp).
int apply(std::span<const std::string> words);

// `photofx help EFFECT`, also what `photofx apply EFFECT --help` prints.
int help_effect(const fxcat::Effect& effect);

}  // namespace fxtool
