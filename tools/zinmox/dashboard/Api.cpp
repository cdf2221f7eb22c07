// The JSON routes of the dashboard. Every request is untrusted: bodies are parsed with
// exceptions caught, each key is checked for its type, and unknown keys are refused.
#include "Api.h"

#include <set>
#include <sstream>

#include "Vcd.h"
#include "ZinHost/ReadingJson.h"

namespace zinmox::dashboard {

namespace {

using Json = nlohmann::json;
using Handler = std::function<Json(const httplib::Request&)>;

// Texts from a request may hold bytes that are not UTF-8; they are replaced, never a failure.
std::string dumpJson(const Json& json) {
  return json.dump(-1, ' ', false, Json::error_handler_t::replace);
}

// Runs `handler` and turns what it returns or throws into the response.
httplib::Server::Handler route(Handler handler) {
  return [handler = std::move(handler)](const httplib::Request& req, httplib::Response& res) {
    try {
      res.set_content(dumpJson(handler(req)), "application/json");
    } catch (const ApiError& error) {
      setError(res, error.status(), error.what());
    } catch (const std::exception& error) {
      setError(res, 500, std::string("internal error: ") + error.what());
    }
  };
}

// The request body as a JSON object whose keys are all in `allowed`.
Json body(const httplib::Request& req, const std::set<std::string>& allowed) {
  Json parsed = Json::parse(req.body, nullptr, false);
  if (parsed.is_discarded()) throw ApiError(400, "the body is not valid JSON");
  if (!parsed.is_object()) throw ApiError(400, "the body must be a JSON object");
  for (const auto& item : parsed.items()) {
    if (allowed.count(item.key()) == 0) {
      throw ApiError(400, "unknown key '" + item.key().substr(0, 64) + "'");
    }
  }
  return parsed;
}

std::string text(const Json& object, const char* key) {
  const auto found = object.find(key);
  if (found == object.end()) throw ApiError(400, std::string("'") + key + "' is missing");
  if (!found->is_string()) throw ApiError(400, std::string("'") + key + "' must be a text");
  return found->get<std::string>();
}

// "bits": "0-7" or [0, 1, 2] (numbers up to 65535).
std::string bitsText(const Json& object) {
  const auto found = object.find("bits");
  if (found == object.end() || !found->is_array()) return text(object, "bits");
  std::string joined;
  for (const Json& bit : *found) {
    if (!bit.is_number_unsigned() || bit.get<uint64_t>() > 65535) {
      throw ApiError(400, "'bits' must be a bit list text or an array of bit numbers");
    }
    joined += (joined.empty() ? "" : ",") + std::to_string(bit.get<uint64_t>());
  }
  if (joined.empty()) throw ApiError(400, "'bits' is empty");
  return joined;
}

Json settingsJson(const LiveSettings& settings) {
  return Json{{"core", settings.core.empty() ? Json() : Json(settings.core)},
              {"rate_hz", settings.rateHz},
              {"paused", settings.paused}};
}

void writeRoutes(httplib::Server& server, HostLink& host, ReadHub& hub) {
  const char* const core = R"(/api/cores/([^/]{1,64}))";
  server.Get(core, route([&host](const httplib::Request& req) {
               return host.coreDetails(req.matches[1]);
             }));
  server.Post(std::string(core) + "/define", route([&](const httplib::Request& req) {
                const Json b = body(req, {"name", "port", "bits"});
                host.define(req.matches[1], text(b, "name"), text(b, "port"), bitsText(b));
                hub.notify();
                return host.coreDetails(req.matches[1]);
              }));
  server.Post(std::string(core) + "/undefine", route([&](const httplib::Request& req) {
                const Json b = body(req, {"name", "port"});
                host.undefine(req.matches[1], text(b, "name"), text(b, "port"));
                hub.notify();
                return host.coreDetails(req.matches[1]);
              }));
  server.Post(std::string(core) + "/write", route([&](const httplib::Request& req) {
                const Json b = body(req, {"values"});
                const auto values = b.find("values");
                if (values == b.end() || !values->is_object()) {
                  throw ApiError(400, "'values' must be an object of NAME: HEX");
                }
                std::vector<std::pair<std::string, std::string>> assignments;
                for (const auto& item : values->items()) {
                  if (!item.value().is_string()) {
                    throw ApiError(
                        400, "the value of '" + item.key().substr(0, 64) + "' must be a hex text");
                  }
                  assignments.emplace_back(item.key(), item.value().get<std::string>());
                }
                host.write(req.matches[1], assignments);
                hub.notify();
                return Json{{"written", *values}};
              }));
}

std::optional<double> number(const Json& object, const char* key) {
  const auto found = object.find(key);
  if (found == object.end()) return std::nullopt;
  if (!found->is_number()) throw ApiError(400, std::string("'") + key + "' must be a number");
  return found->get<double>();
}

void liveRoutes(httplib::Server& server, HostLink& host, ReadHub& hub) {
  server.Get("/api/target", route([&](const httplib::Request&) {
               Json target = host.scan();
               target["live"] = settingsJson(hub.settings());
               target["limits"] = {{"min_rate_hz", kMinRateHz},   {"max_rate_hz", kMaxRateHz},
                                   {"history", kHistoryLength},   {"body_bytes", kMaxBodyBytes},
                                   {"live_views", kMaxLiveViews}, {"names", kMaxNamesPerCore}};
               return target;
             }));
  server.Post("/api/live", route([&](const httplib::Request& req) {
                const Json b = body(req, {"core", "rate_hz", "paused"});
                std::optional<std::string> core;
                if (b.contains("core")) core = text(b, "core");
                std::optional<bool> paused;
                if (b.contains("paused")) {
                  if (!b["paused"].is_boolean())
                    throw ApiError(400, "'paused' must be true or false");
                  paused = b["paused"].get<bool>();
                }
                return settingsJson(hub.configure(core, number(b, "rate_hz"), paused));
              }));
  server.Get("/api/waveform.vcd", [&hub](const httplib::Request&, httplib::Response& res) {
    const auto [core, samples] = hub.history();
    if (samples.empty()) return setError(res, 404, "no reads are kept yet: choose a core");
    std::ostringstream out;
    VcdWriter writer(out, "core_" + core, samples.front().inputs);
    // Time 0 is the oldest kept read.
    for (const Sample& sample : samples) {
      writer.sample(sample.timeUs - samples.front().timeUs, sample.inputs);
    }
    res.set_header("Content-Disposition",
                   "attachment; filename=\"zinmox-" + vcdName(core) + ".vcd\"");
    res.set_content(out.str(), "text/plain");
  });
}

}  // namespace

std::string eventText(const HubState& state, uint64_t hostVersion) {
  return "data: " + dumpJson(stateJson(state, hostVersion)) + "\n\n";
}

void setError(httplib::Response& res, int status, const std::string& text) {
  res.status = status;
  res.set_content(dumpJson(Json{{"error", text}}), "application/json");
}

Json stateJson(const HubState& state, uint64_t hostVersion) {
  Json samples = Json::array();
  for (const Sample& sample : state.samples) {
    Json inputs = Json::array();
    for (const Reading& reading : sample.inputs) inputs.push_back(ZinHost::readingJson(reading));
    samples.push_back({{"seq", sample.seq}, {"t_us", sample.timeUs}, {"inputs", inputs}});
  }
  return Json{{"live", settingsJson(state.settings)},
              {"version", hostVersion},
              {"error", state.error},
              {"history_start", state.historyStart},
              {"samples", samples}};
}

void addApiRoutes(httplib::Server& server, HostLink& host, ReadHub& hub) {
  writeRoutes(server, host, hub);
  liveRoutes(server, host, hub);
}

}  // namespace zinmox::dashboard
