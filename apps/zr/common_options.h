// Options that several verbs share, told once.
#pragma once

#include <ZR/zr.h>

#include <CLI/CLI.hpp>
#include <string>

#include "progress_line.h"

namespace zr::tool {

inline void add_force(CLI::App& verb, bool& force) {
  verb.add_flag("--force", force, "Replace files that exist already (default: they are an error)");
}

inline void add_threads(CLI::App& verb, int& threads) {
  verb.add_option("--threads", threads, "Threads for row-parallel work; 0 takes the machine's count")
      ->check(CLI::Range(0, 1024).description(""))
      ->type_name("NUMBER 0..1024")
      ->capture_default_str();
}

// Bytes of the machine's memory.
u64 machine_memory();
// "512M", "2G", "1.5GiB" or plain bytes; throws ToolError naming `option`.
u64 parse_memory(const std::string& text, const std::string& option);

}  // namespace zr::tool
