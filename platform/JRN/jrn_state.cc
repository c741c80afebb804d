// The log, on spdlog. Nothing is opened before the first line, and no thread is started.
#include <JRN/jrn.h>
#include <OPT/opt.h>

#include <spdlog/logger.h>
#include <spdlog/sinks/basic_file_sink.h>
#include <spdlog/sinks/stdout_sinks.h>

#include <memory>
#include <mutex>
#include <string>

namespace {

// Never destroyed: a line may be written while the process ends.
struct Journal {
  std::mutex lock;  // guards what follows; the logger itself may be used by any thread
  std::string file;
  std::shared_ptr<spdlog::logger> logger;
};
Journal& journal() {
  static auto* const instance = new Journal;
  return *instance;
}

std::shared_ptr<spdlog::logger> open(const std::string& file) {
  spdlog::sink_ptr sink;
  std::string trouble;
  if (!file.empty()) try {
      sink = std::make_shared<spdlog::sinks::basic_file_sink_mt>(file);
    } catch (const std::exception& error) {
      trouble = error.what();
    }
  if (sink == nullptr) sink = std::make_shared<spdlog::sinks::stderr_sink_mt>();
  auto logger = std::make_shared<spdlog::logger>("ZR", std::move(sink));
  logger->set_level(spdlog::level::trace);  // lines are dropped here, by their number
  logger->flush_on(spdlog::level::trace);
  logger->set_pattern("%Y-%m-%d %H:%M:%S.%e [%l] %v");
  if (!trouble.empty()) logger->log(spdlog::level::warn, spdlog::string_view_t(trouble));
  return logger;
}

std::shared_ptr<spdlog::logger> logger_for(const std::string& file) {
  Journal& log = journal();
  const std::lock_guard hold(log.lock);
  if (log.logger == nullptr || log.file != file) {
    log.logger = open(file);
    log.file = file;
  }
  return log.logger;
}

spdlog::level::level_enum name_of(i32 level) {
  if (level >= 50) return spdlog::level::critical;
  if (level >= 40) return spdlog::level::err;
  if (level >= 30) return spdlog::level::warn;
  return level >= 10 ? spdlog::level::info : spdlog::level::debug;
}

}  // namespace

void JRN_Log(i32 level, const char* module, const char* key, const char* text) noexcept {
  try {
    // Lines are rare, so the preferences are asked each time: a change counts at once.
    if (level < OPT_GetInt("log.level", 30)) return;
    std::string line;
    for (const char* part : {module, " ", key, ": ", text}) line += part != nullptr ? part : "";
    logger_for(OPT_GetString("log.file", ""))->log(name_of(level), spdlog::string_view_t(line));
  } catch (...) {
    // A log that cannot be written is no reason to fail.
  }
}
