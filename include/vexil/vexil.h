// Everything a host uses, in one include: records, trace types and the trace queue, the
// connection interface and its exports, the LSP model, the language table, URI functions,
// the directory watchers and the watcher tasks. Every public header is listed here.
#pragma once

#include "vexil/export.h"
#include "vexil/host/trace.h"
#include "vexil/host/records.h"
#include "vexil/host/language_server.h"
#include "vexil/json/json.h"
#include "vexil/protocol/message.h"
#include "vexil/protocol/structures.h"
#include "vexil/protocol/capabilities.h"
#include "vexil/protocol/server_capabilities.h"
#include "vexil/protocol/initialize.h"
#include "vexil/protocol/feature_params.h"
#include "vexil/protocol/feature_results.h"
#include "vexil/protocol/diagnostics.h"
#include "vexil/client/languages.h"
#include "vexil/client/uri.h"
#include "vexil/watch/change_event.h"
#include "vexil/watch/watcher_ex.h"
#include "vexil/watch/watcher.h"
#include "vexil/task/watcher_options.h"
#include "vexil/task/watcher_task.h"
