#!/usr/bin/env python3
"""Records real language-server replies for the reading tests.

Runs clangd or pylsp on the example projects under examples/, sends the requests the
library sends (the initialize body is the hand-written golden request), and saves each
reply body verbatim under tests/data/replies/<server>/<request>.json.

    tests/data/record/record_replies.py clangd
    tests/data/record/record_replies.py pylsp
"""
import json
import os
import pathlib
import subprocess
import sys
import urllib.parse

ROOT = pathlib.Path(__file__).resolve().parents[3]
DATA = ROOT / "tests" / "data"

SERVERS = {
    "clangd": {
        "command": ["clangd", "--log=error"],
        "project": ROOT / "examples" / "cpp",
        "language": "cpp",
        "files": ["shapes.h", "shapes.cpp", "main.cpp"],
        "main": "main.cpp",
        "symbols": "shapes.h",
        "call": "shapes::Clamp(",
        "member": "rectangle.Scale",
        "function": "Clamp",
        "new_name": "Limit",
        "query": "Rect",
    },
    "pylsp": {
        "command": ["pylsp"],
        "project": ROOT / "examples" / "python",
        "language": "python",
        "files": ["geometry.py", "main.py"],
        "main": "main.py",
        "symbols": "geometry.py",
        "call": "print(clamp(",
        "member": "rectangle.scale",
        "function": "clamp",
        "new_name": "limit",
        "query": "Rect",
    },
}


def file_uri(path):
    return "file://" + urllib.parse.quote(str(path))


class Server:
    def __init__(self, command, cwd):
        self.process = subprocess.Popen(command, cwd=cwd, stdin=subprocess.PIPE, stdout=subprocess.PIPE)
        self.next_id = 1

    def send(self, message):
        body = json.dumps(message, separators=(",", ":")).encode()
        self.send_body(body)

    def send_body(self, body):
        self.process.stdin.write(b"Content-Length: %d\r\n\r\n" % len(body) + body)
        self.process.stdin.flush()

    def receive(self):
        length = None
        while True:
            line = self.process.stdout.readline()
            if not line:
                raise RuntimeError("server closed its output")
            line = line.strip()
            if not line:
                break
            name, _, value = line.partition(b":")
            if name.lower() == b"content-length":
                length = int(value)
        return self.process.stdout.read(length)

    def request(self, method, params, body=None):
        """Sends a request and returns the raw text of its reply, answering server requests."""
        request_id = self.next_id
        self.next_id += 1
        if body is None:
            self.send({"jsonrpc": "2.0", "id": request_id, "method": method, "params": params})
        else:
            self.send_body(body)
        while True:
            text = self.receive()
            message = json.loads(text)
            if "method" in message and "id" in message:
                self.send({"jsonrpc": "2.0", "id": message["id"], "result": None})
            elif message.get("id") == request_id and "method" not in message:
                return text.decode()

    def notify(self, method, params):
        self.send({"jsonrpc": "2.0", "method": method, "params": params})


def position_of(text, needle, offset=0):
    index = text.index(needle) + offset
    line = text.count("\n", 0, index)
    return {"line": line, "character": index - (text.rfind("\n", 0, index) + 1)}


def initialize_body(project):
    """The golden request with this machine's process, project and no host options."""
    message = json.loads((DATA / "initialize_request.json").read_text())
    params = message["params"]
    params["processId"] = os.getpid()
    params["rootUri"] = file_uri(project)
    del params["initializationOptions"]
    params["workspaceFolders"] = [{"uri": file_uri(project), "name": project.name}]
    return json.dumps(message, separators=(",", ":")).encode()


def record(name):
    config = SERVERS[name]
    project = config["project"]
    out = DATA / "replies" / name
    out.mkdir(parents=True, exist_ok=True)
    server = Server(config["command"], project)
    replies = {"initialize": server.request("initialize", None, initialize_body(project))}
    server.notify("initialized", {})
    for file in config["files"]:
        server.notify("textDocument/didOpen", {"textDocument": {
            "uri": file_uri(project / file), "languageId": config["language"], "version": 1,
            "text": (project / file).read_text()}})

    main = {"uri": file_uri(project / config["main"])}
    text = (project / config["main"]).read_text()
    at_function = position_of(text, config["call"], config["call"].index(config["function"]))
    at_call = position_of(text, config["call"], len(config["call"]))
    at_member = position_of(text, config["member"], config["member"].index(".") + 1)

    def positioned(position, **extra):
        return dict({"textDocument": main, "position": position}, **extra)

    replies["hover"] = server.request("textDocument/hover", positioned(at_function))
    replies["completion"] = server.request("textDocument/completion",
                                           positioned(at_member, context={"triggerKind": 1}))
    replies["definition"] = server.request("textDocument/definition", positioned(at_function))
    replies["references"] = server.request("textDocument/references",
                                           positioned(at_function, context={"includeDeclaration": True}))
    replies["documentSymbol"] = server.request("textDocument/documentSymbol", {
        "textDocument": {"uri": file_uri(project / config["symbols"])}})
    replies["signatureHelp"] = server.request("textDocument/signatureHelp", positioned(at_call))
    replies["formatting"] = server.request("textDocument/formatting", {
        "textDocument": main, "options": {"tabSize": 2, "insertSpaces": True}})
    replies["rename"] = server.request("textDocument/rename", positioned(at_function, newName=config["new_name"]))
    replies["workspaceSymbol"] = server.request("workspace/symbol", {"query": config["query"]})

    server.request("shutdown", None)
    server.notify("exit", None)
    server.process.wait(timeout=10)
    for request, reply in replies.items():
        (out / (request + ".json")).write_text(reply)
        print(name, request, len(reply), "bytes")


if __name__ == "__main__":
    for server_name in sys.argv[1:] or SERVERS:
        record(server_name)
