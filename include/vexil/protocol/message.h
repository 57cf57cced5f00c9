// The JSON-RPC envelope: requests with process-wide ids, notifications, responses bound
// to the caller's result object, and the two payload bases every params and result derives from.
#pragma once

#include <string>

#include "vexil/json/json.h"

namespace LSP {

// What a request or notification carries, written under the key Name() ("params").
class VEXIL_API Params : public JsonObject {
 public:
  const char* Name() const override { return name; }
  void Read(const xObject& value) override {}
  using JsonObject::Read;

  const char* name = "params";
};

// What a response carries. Lists override IsObject(): their JSON result is an array.
class VEXIL_API Result : public JsonObject {
 public:
  const char* Name() const override { return "result"; }
  virtual bool IsObject() { return true; }
};

class VEXIL_API MessageBase : public JsonObject {
 public:
  const char* Name() const override { return "response"; }
  using JsonObject::Read;
  virtual std::string ToJSON() { return ""; }
  virtual bool IsRequest() { return false; }

  std::string jsonrpc = "2.0";

 protected:
  void Read(const xObject& value) override;
  void Write(xWriter& writer) override;
};

// A request takes the next id of one process-wide counter (1, 2, ...) when it is built.
// The params are not owned and must outlive the writing of the message.
class VEXIL_API RequestMessage : public MessageBase {
 public:
  RequestMessage(const char* method, Params* params);
  const char* Name() const override { return "request"; }
  std::string ToJSON() override;
  bool IsRequest() override { return true; }

  int id;
  std::string method;
  Params* params;

 protected:
  void Write(xWriter& writer) override;
};

class VEXIL_API NotificationMessage : public MessageBase {
 public:
  NotificationMessage(const char* method, Params* params);
  const char* Name() const override { return "request"; }
  std::string ToJSON() override;
  bool IsRequest() override { return false; }

  std::string method;
  Params* params;

 protected:
  void Write(xWriter& writer) override;
};

class VEXIL_API ResponseError : public JsonObject {
 public:
  const char* Name() const override { return "error"; }
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  int code = 0;
  std::string message;
};

// A reply read into the caller's result object (not owned). A null result leaves it untouched.
class VEXIL_API ResponseMessage : public MessageBase {
 public:
  explicit ResponseMessage(Result* result) : result(result) {}

  // Reads the document's root, not a member of it.
  void Read(xReader& reader) override;
  bool HaveError() const { return error.code != 0 || !error.message.empty(); }
  const char* ErrorMessage() const { return error.message.c_str(); }
  bool MethodNotFound() const { return error.code == -32601; }
  bool WantDebug() const { return wantDebug; }
  void WantDebug(bool want) { wantDebug = want; }
  static bool ReadDebug(std::string& text) { return true; }

  Result* result;
  int id = -1;
  bool wantDebug = false;
  ResponseError error;

 protected:
  void Read(const xObject& value) override;
};

class VEXIL_API CancelParams : public Params {
 public:
  explicit CancelParams(int id) : id(id) {}
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override;

  int id;
};

}  // namespace LSP
