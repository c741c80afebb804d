// zr verify: one answer on every processor and any number of threads.
#include <CLI/CLI.hpp>
#include <chrono>
#include <cstdio>
#include <fstream>
#include <memory>
#include <nlohmann/json.hpp>
#include <set>

#include "commands.h"
#include "common_options.h"
#include "depths.h"
#include "nearest_name.h"
#include "output_files.h"
#include "progress_line.h"
#include "tool_error.h"
#include "verify/runs.h"

namespace zr::tool {
namespace {

using Clock = std::chrono::steady_clock;

struct VerifyOptions {
  std::vector<std::string> operations, sets;
  std::vector<int> threads = {1, 2, 7};
  std::string manifest, write;
  bool list = false, json = false, force = false;
};

std::string group_of(const std::string& name) { return name.substr(0, name.find('/')); }

// Operations by their names or those of their groups.
Chosen chosen_operations(const std::vector<std::string>& names) {
  std::set<std::string> known;
  for (const Operation& one : all_operations()) known.insert({one.name, group_of(one.name)});
  for (const std::string& name : names)
    if (known.count(name) == 0)
      throw bad_input("verify: unknown operation \"" + name + "\"; the nearest is " +
                      quoted_list(nearest_names(name, {known.begin(), known.end()}, 3)));
  const auto named = [&](const std::string& name) {
    return std::find(names.begin(), names.end(), name) != names.end();
  };
  Chosen chosen;
  for (const Operation& one : all_operations())
    if (names.empty() || named(one.name) || named(group_of(one.name))) chosen.push_back(&one);
  return chosen;
}

std::vector<Setting> settings_of(const VerifyOptions& options) {
  const std::vector<std::string> present = processor_sets();
  for (const std::string& set : options.sets)
    if (std::find(present.begin(), present.end(), set) == present.end())
      throw bad_input("verify: this processor has no " + set + ", only " + quoted_list(present, " and "));
  std::vector<Setting> settings;
  for (const std::string& set : options.sets.empty() ? present : options.sets)
    for (const int threads : options.threads) settings.push_back({set, threads});
  return settings;
}

std::string numbers_text(const std::vector<int>& numbers) {
  std::string text;
  for (const int number : numbers) text += (text.empty() ? "" : ", ") + std::to_string(number);
  return text;
}

std::string line_of(const Difference& one) {
  return one.operation->name + ' ' + depth_name(one.operation->depth) + ": " + one.instruction_set + ", threads " +
         numbers_text(one.threads) + ": " + one.found +
         (one.expected.empty() ? ", not in the manifest" : " in place of " + one.expected);
}

// The keys of lines that no operation answers to.
std::vector<std::string> lines_without_operation(const Manifest& manifest) {
  std::set<std::pair<std::string, i32>> known;
  for (const Operation& one : all_operations()) known.insert({one.name, one.depth});
  std::vector<std::string> lines;
  for (const auto& [key, hash] : manifest)
    if (known.count(key) == 0) lines.push_back(key.first + ' ' + depth_name(key.second));
  return lines;
}

struct Outcome {
  size_t operations = 0;
  std::vector<Setting> settings;
  std::vector<Difference> differences;
  std::vector<std::string> lines_without_operation;
  f64 seconds = 0;
  size_t count() const { return differences.size() + lines_without_operation.size(); }
};

std::string as_json(const Outcome& outcome) {
  nlohmann::ordered_json sets = nlohmann::ordered_json::array(), differences = sets;
  for (const Setting& setting : outcome.settings)
    sets.push_back({{"instruction_set", setting.instruction_set}, {"threads", setting.threads}});
  for (const Difference& one : outcome.differences)
    differences.push_back(
        {{"operation", one.operation->name},
         {"depth", depth_name(one.operation->depth)},
         {"instruction_set", one.instruction_set},
         {"threads", one.threads},
         {"expected", one.expected.empty() ? nlohmann::ordered_json() : nlohmann::ordered_json(one.expected)},
         {"found", one.found}});
  const nlohmann::ordered_json all = {{"agree", outcome.count() == 0},
                                      {"operations", outcome.operations},
                                      {"settings", sets},
                                      {"differences", differences},
                                      {"lines_without_operation", outcome.lines_without_operation},
                                      {"seconds", outcome.seconds}};
  return all.dump(2) + '\n';
}

std::string as_text(const Outcome& outcome) {
  std::string text;
  for (const Difference& one : outcome.differences) text += line_of(one) + '\n';
  for (const std::string& line : outcome.lines_without_operation) text += line + ": no such operation\n";
  if (outcome.count() != 0) return text;
  std::string sets;
  std::vector<int> threads;
  for (const Setting& setting : outcome.settings) {
    if (sets.find(setting.instruction_set) == std::string::npos)
      sets += (sets.empty() ? "" : ", ") + setting.instruction_set;
    if (std::find(threads.begin(), threads.end(), setting.threads) == threads.end()) threads.push_back(setting.threads);
  }
  return std::to_string(outcome.operations) + " operations agree: " + sets + "; threads " + numbers_text(threads) +
         " (" + duration_text(outcome.seconds) + ")\n";
}

void list_operations(const Chosen& chosen, bool json) {
  nlohmann::ordered_json list = nlohmann::ordered_json::array();
  for (const Operation* one : chosen) {
    if (json)
      list.push_back({{"operation", one->name}, {"depth", depth_name(one->depth)}});
    else
      std::printf("%s %s\n", one->name.c_str(), depth_name(one->depth));
  }
  if (json) std::puts(list.dump(2).c_str());
}

void write_manifest(const Manifest& manifest, const std::string& file) {
  OutputFolders folders;
  folders.make_for(file);
  write_then_rename(file, [&](const std::string& part) {
    std::ofstream stream(part, std::ios::binary);
    if (!(stream << manifest_text(manifest)).flush()) throw file_error(file + " cannot be written");
  });
}

Manifest manifest_of(const VerifyOptions& options) {
  if (!options.write.empty()) return {};
  return options.manifest.empty() ? parse_manifest(embedded_manifest(), "the built-in manifest")
                                  : load_manifest(options.manifest);
}

void verify(const VerifyOptions& options) {
  const Chosen chosen = chosen_operations(options.operations);
  if (options.list) return list_operations(chosen, options.json);
  if (!options.write.empty()) check_outputs({options.write}, {}, options.force);
  Manifest manifest = manifest_of(options);
  Outcome outcome;
  outcome.operations = chosen.size();
  outcome.settings = settings_of(options);
  if (options.operations.empty()) outcome.lines_without_operation = lines_without_operation(manifest);

  const Clock::time_point begun = Clock::now();
  const auto seconds = [&] { return std::chrono::duration<f64>(Clock::now() - begun).count(); };
  {
    ProgressLine line(options.json ? ProgressMode::kOff : ProgressMode::kAuto, 1);
    f64 shown = 0;
    outcome.differences = compare_runs(
        chosen, outcome.settings, manifest, !options.write.empty(),
        [&](const Setting& setting, size_t done, size_t total) {
          const f64 now = seconds();
          if (now - shown < 0.1) return;
          shown = now;
          line.say(setting.instruction_set + ", threads " + std::to_string(setting.threads) + ": " +
                   std::to_string(done * 100 / total) + " %, " +
                   duration_text(seconds_left(now, static_cast<i32>(done), static_cast<i32>(total))) + " left");
        });
  }
  outcome.seconds = seconds();
  std::fputs((options.json ? as_json(outcome) : as_text(outcome)).c_str(), stdout);
  if (outcome.count() != 0)
    throw ToolError(kExitDifference, "verify: " + std::to_string(outcome.count()) +
                                         (options.write.empty() ? " differences" : " differences, nothing is written"));
  if (!options.write.empty()) write_manifest(manifest, options.write);
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<VerifyOptions>();
  verb.add_option("--operation", options->operations, "Only this operation, or this group of them; may be repeated")
      ->type_name("NAME")
      ->expected(1)
      ->take_all();
  verb.add_option("--cpu", options->sets, "Only these instruction sets, with commas between (default: all there are)")
      ->delimiter(',')
      ->check(CLI::IsMember(known_sets()).description(""))
      ->type_name("scalar|sse4|avx2|avx512");
  verb.add_option("--threads", options->threads, "Thread counts, with commas between")
      ->delimiter(',')
      ->check(CLI::Range(1, 1024).description(""))
      ->type_name("NUMBER 1..1024")
      ->capture_default_str();
  CLI::Option* manifest =
      verb.add_option("--manifest", options->manifest, "Compare with this file, not with the built-in manifest")
          ->type_name("FILE");
  verb.add_option("--write", options->write, "Write a manifest, provided that all instruction sets and threads agree")
      ->type_name("FILE")
      ->excludes(manifest);
  add_force(verb, options->force);
  verb.add_flag("--list", options->list, "Print operations and depths, and do nothing");
  verb.add_flag("--json", options->json, "Print one JSON object (with --list a list)");
  verb.footer(
      "Repeats every operation at every depth on fixed inputs, for each instruction set that this processor has and\n"
      "for several thread counts, and compares the results to the last bit with a manifest: lines of operation, depth\n"
      "and a 128-bit hash. What differs is named by operation, depth, instruction set and threads; the exit code is\n"
      "then 5. A missing line, and a line without operation, count as differences.\n\n"
      "Aligned float rows on their way to 8 bits have a rule of their own where there are vectors, so they are\n"
      "compared on all sets but scalar. All NaNs count as one value.\n\n"
      "Examples:\n"
      "  zr verify                                 everything; some seconds\n"
      "  zr verify --operation transfer/screen     one operation\n"
      "  zr verify --operation transform --cpu scalar,avx2 --threads 1\n"
      "  zr verify --list                          names and depths\n"
      "  zr verify --json                          for machines\n"
      "  zr verify --write manifest.txt            after a result was changed on purpose");
  return [options] { verify(*options); };
}

}  // namespace

const Command kVerifyCommand = {"verify", "Check that every operation gives its exact result on this machine",
                                &declare};

}  // namespace zr::tool
