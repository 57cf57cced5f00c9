// What goes beyond the typed calls: features the host opts in to, requests and
// notifications of any method with params given as JSON text, and the server's own
// messages handed to the host.
#include "client/language_server.h"

#include "vexil/protocol/code_actions.h"

namespace LSP {

bool LanguageServer::Enable(const char* feature) {
  if (!feature || !EnableFeature(feature, features)) return false;
  server.RouteToHost(features.hostRequests, features.hostAnswersUnknown);
  return true;
}

bool LanguageServer::Prepared(const char* method, const char* paramsJson, JsonParams& params) {
  std::string error;
  if (!method || !*method) {
    server.Refuse("A message needs a method name.");
    return false;
  }
  if (params.Parse(paramsJson, error)) return true;
  server.Refuse("Invalid JSON for " + std::string(method) + ": " + error);
  return false;
}

std::string LanguageServer::Request(const char* method, const char* paramsJson) {
  JsonParams params;
  if (!Prepared(method, paramsJson, params)) return "";
  return RequestJson(method, params.Empty() ? nullptr : &params);
}

std::string LanguageServer::RequestJson(const char* method, Params* params) {
  JsonResult holder;
  if (!Request(method, params, holder)) return "";
  return holder.json.empty() ? "null" : holder.json;
}

bool LanguageServer::Notify(const char* method, const char* paramsJson) {
  JsonParams params;
  return Prepared(method, paramsJson, params) && Send(method, params.Empty() ? nullptr : &params);
}

void LanguageServer::SetMessageHandler(xMessageHandler handler, void* userData) {
  server.SetMessageHandler(handler, userData);
}

}  // namespace LSP
