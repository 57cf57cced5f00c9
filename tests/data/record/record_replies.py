#!/usr/bin/env python3
"""Records real language-server replies for the reading tests.

Runs clangd or pylsp on the example projects under examples/, sends the requests the
library sends (the initialize body is the hand-written golden request), and saves each
reply body verbatim under tests/data/replies/<server>/<request>.json.

Three sessions: "classic" sends the classic requests with the default capabilities;
"features" merges tests/data/feature_capabilities.json (what the library announces when
a host opts in) over them and sends the newer requests; "commands" asks for code actions
with the default capabilities, which servers answer with bare commands.

    tests/data/record/record_replies.py clangd
    tests/data/record/record_replies.py pylsp features commands
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
        # A document that is not on disk, with an error the server offers a fix for.
        "broken": ("broken.cpp", '#include "shapes.h"\n\nint Twice(int value) { return value * 2 }\n'),
        "folded": "shapes.cpp",
        "expression": "rectangle.Area()",
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
        "broken": ("broken.py", "import os\n\n\ndef twice(value):\n    return value * 2\n"),
        "folded": "geometry.py",
        "expression": "rectangle.area()",
    },
}


def file_uri(path):
    return "file://" + urllib.parse.quote(str(path))


class Server:
    def __init__(self, command, cwd):
        self.process = subprocess.Popen(command, cwd=cwd, stdin=subprocess.PIPE, stdout=subprocess.PIPE)
        self.next_id = 1
        self.diagnostics = {}       # the newest publication of each document, as sent
        self.server_requests = {}   # the raw text of the first request of each method

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
                self.server_requests.setdefault(message["method"], text.decode())
                result = {"applied": True} if message["method"] == "workspace/applyEdit" else None
                self.send({"jsonrpc": "2.0", "id": message["id"], "result": result})
            elif message.get("method") == "textDocument/publishDiagnostics":
                self.diagnostics[message["params"]["uri"]] = message["params"]["diagnostics"]
            elif message.get("id") == request_id and "method" not in message:
                return text.decode()

    def published(self, uri):
        """Waits for the first non-empty publication of the document's diagnostics."""
        while not self.diagnostics.get(uri):
            message = json.loads(self.receive())
            if message.get("method") == "textDocument/publishDiagnostics":
                self.diagnostics[message["params"]["uri"]] = message["params"]["diagnostics"]
        return self.diagnostics[uri]

    def notify(self, method, params):
        self.send({"jsonrpc": "2.0", "method": method, "params": params})


def position_of(text, needle, offset=0):
    index = text.index(needle) + offset
    line = text.count("\n", 0, index)
    return {"line": line, "character": index - (text.rfind("\n", 0, index) + 1)}


def merge(target, source):
    """Merges as the library merges capability additions: objects member by member."""
    for key, value in source.items():
        if isinstance(target.get(key), dict) and isinstance(value, dict):
            merge(target[key], value)
        else:
            target[key] = value


def initialize_body(project, additions=None):
    """The golden request with this machine's process, project and no host options."""
    message = json.loads((DATA / "initialize_request.json").read_text())
    params = message["params"]
    if additions:
        merge(params["capabilities"], json.loads((DATA / additions).read_text()))
    params["processId"] = os.getpid()
    params["rootUri"] = file_uri(project)
    del params["initializationOptions"]
    params["workspaceFolders"] = [{"uri": file_uri(project), "name": project.name}]
    return json.dumps(message, separators=(",", ":")).encode()


class Session:
    """One server run on one example project: open its files, ask, save the replies."""

    def __init__(self, name, additions=None):
        self.config = SERVERS[name]
        self.project = self.config["project"]
        self.out = DATA / "replies" / name
        self.server = Server(self.config["command"], self.project)
        self.replies = {"initialize": self.server.request(
            "initialize", None, initialize_body(self.project, additions))}
        self.server.notify("initialized", {})
        for file in self.config["files"]:
            self.open(file, (self.project / file).read_text())
        self.main = {"uri": file_uri(self.project / self.config["main"])}
        self.text = (self.project / self.config["main"]).read_text()

    def open(self, file, text):
        self.server.notify("textDocument/didOpen", {"textDocument": {
            "uri": file_uri(self.project / file), "languageId": self.config["language"], "version": 1,
            "text": text}})

    def at(self, needle, offset=0):
        return position_of(self.text, needle, offset)

    def positioned(self, position, **extra):
        return dict({"textDocument": self.main, "position": position}, **extra)

    def ask(self, name, method, params):
        self.replies[name] = self.server.request(method, params)
        return json.loads(self.replies[name]).get("result")

    def save(self, names=None):
        self.server.request("shutdown", None)
        self.server.notify("exit", None)
        self.server.process.wait(timeout=10)
        self.out.mkdir(parents=True, exist_ok=True)
        for request, reply in self.replies.items():
            if names is None or request in names:
                (self.out / (request + ".json")).write_text(reply)
                print(self.out.name, request, len(reply), "bytes")


def record_classic(name):
    session = Session(name)
    config = session.config
    at_function = session.at(config["call"], config["call"].index(config["function"]))
    at_call = session.at(config["call"], len(config["call"]))
    at_member = session.at(config["member"], config["member"].index(".") + 1)
    positioned = session.positioned
    session.ask("hover", "textDocument/hover", positioned(at_function))
    session.ask("completion", "textDocument/completion", positioned(at_member, context={"triggerKind": 1}))
    session.ask("definition", "textDocument/definition", positioned(at_function))
    session.ask("references", "textDocument/references",
                positioned(at_function, context={"includeDeclaration": True}))
    session.ask("documentSymbol", "textDocument/documentSymbol", {
        "textDocument": {"uri": file_uri(session.project / config["symbols"])}})
    session.ask("signatureHelp", "textDocument/signatureHelp", positioned(at_call))
    session.ask("formatting", "textDocument/formatting", {
        "textDocument": session.main, "options": {"tabSize": 2, "insertSpaces": True}})
    session.ask("rename", "textDocument/rename", positioned(at_function, newName=config["new_name"]))
    session.ask("workspaceSymbol", "workspace/symbol", {"query": config["query"]})
    session.save()


def ask_code_actions(session, name):
    """Code actions for the first diagnostic of the broken document, which is opened first."""
    file, text = session.config["broken"]
    session.open(file, text)
    uri = file_uri(session.project / file)
    diagnostic = session.server.published(uri)[0]
    return session.ask(name, "textDocument/codeAction", {
        "textDocument": {"uri": uri}, "range": diagnostic["range"], "context": {"diagnostics": [diagnostic]}})


def record_features(name):
    session = Session(name, "feature_capabilities.json")
    config = session.config
    at_function = session.at(config["call"], config["call"].index(config["function"]))
    at_variable = session.at(config["member"])
    at_member = session.at(config["member"], config["member"].index(".") + 1)
    document = {"textDocument": session.main}
    ask_code_actions(session, "codeAction")
    # Refactorings of an expression come as actions that carry a command.
    expression = session.at(config["expression"])
    selected = {"start": expression, "end": dict(expression, character=expression["character"] + len(config["expression"]))}
    actions = session.ask("codeActionRefactor", "textDocument/codeAction",
                          dict(document, range=selected, context={"diagnostics": []})) or []
    command = next((action.get("command") for action in actions if isinstance(action.get("command"), dict)), None)
    session.ask("executeCommand", "workspace/executeCommand",
                {"command": command["command"], "arguments": command.get("arguments", [])} if command
                else {"command": "vexil.none", "arguments": []})
    session.ask("documentHighlight", "textDocument/documentHighlight", session.positioned(at_variable))
    session.ask("foldingRange", "textDocument/foldingRange", {
        "textDocument": {"uri": file_uri(session.project / config["folded"])}})
    session.ask("selectionRange", "textDocument/selectionRange", dict(document, positions=[at_function, at_member]))
    session.ask("semanticTokens", "textDocument/semanticTokens/full", document)
    whole = {"start": {"line": 0, "character": 0}, "end": {"line": session.text.count("\n") + 1, "character": 0}}
    session.ask("inlayHint", "textDocument/inlayHint", dict(document, range=whole))
    completion = session.server.request("textDocument/completion",
                                        session.positioned(at_member, context={"triggerKind": 1}))
    result = json.loads(completion)["result"]
    items = result["items"] if isinstance(result, dict) else result
    session.ask("completionResolve", "completionItem/resolve", items[0])
    session.ask("prepareRename", "textDocument/prepareRename", session.positioned(at_function))
    prepared = session.ask("prepareCallHierarchy", "textDocument/prepareCallHierarchy",
                           session.positioned(at_function))
    item = prepared[0] if prepared else {"name": config["function"], "kind": 12, "uri": session.main["uri"],
                                         "range": {"start": at_function, "end": at_function},
                                         "selectionRange": {"start": at_function, "end": at_function}}
    session.ask("incomingCalls", "callHierarchy/incomingCalls", {"item": item})
    session.ask("outgoingCalls", "callHierarchy/outgoingCalls", {"item": item})
    session.replies["initializeFeatures"] = session.replies.pop("initialize")
    if "workspace/applyEdit" in session.server.server_requests:
        session.replies["applyEdit"] = session.server.server_requests["workspace/applyEdit"]
    session.save()


def record_commands(name):
    session = Session(name)
    ask_code_actions(session, "codeActionCommands")
    session.save({"codeActionCommands"})


SESSIONS = {"classic": record_classic, "features": record_features, "commands": record_commands}


if __name__ == "__main__":
    servers = [argument for argument in sys.argv[1:] if argument in SERVERS] or list(SERVERS)
    sessions = [argument for argument in sys.argv[1:] if argument in SESSIONS] or list(SESSIONS)
    for server_name in servers:
        for session_name in sessions:
            SESSIONS[session_name](server_name)
