#ifndef VORN_PLATFORM_QLIB_PLUGIN_H
#define VORN_PLATFORM_QLIB_PLUGIN_H

#ifdef __cplusplus
extern "C" {
#endif

/* Plug-in hook points. A hook point "<path>" (e.g. "net/gateway_change") runs every executable
 * regular file of the directory "/etc/vorn/plugins/<path>.d/" (under the root prefix) in name
 * order. Each runs with the arguments set on the handle as environment variables, plus
 * PLUGIN_MODULE, PLUGIN_PATH and PLUGIN_ACTION (the action code, decimal; these three win over
 * arguments of the same name), argv[0] its real path (under the root), standard input from
 * /dev/null, in a process group of its own; a run that lasts more than 10 s is killed (the whole
 * group). A failing or killed script is logged and the next one still runs. */
typedef struct QLIBPLUGIN QLIBPLUGIN;

enum { QLIB_PLUGIN_TIMEOUT_SECONDS = 10 };
/* Action codes: a hook runs before a change (topology switch) or after it (everything else). */
enum { QLIB_PLUGIN_ACTION_BEFORE = 4, QLIB_PLUGIN_ACTION_AFTER = 5 };

/* Opens hook point path of module; *handle receives the new handle. 0, or -1 for a null or
 * malformed argument (an empty path, "..", a path that leaves the plug-in directory). */
int QLIBPluginSDKInit(const char* module, const char* path, QLIBPLUGIN** handle);
/* Sets one argument. key must be an environment variable name ([A-Za-z_][A-Za-z0-9_]*) and
 * value must hold no line end. 0 or -1. */
int QLIBPluginSetArg(QLIBPLUGIN* handle, const char* key, const char* value);
/* Runs the hook point's scripts for action. 0 when every script exited with 0 (or there is
 * none), -1 when any failed, timed out or could not start. */
int QLIBPluginAction(int action, QLIBPLUGIN* handle);
/* Releases the handle (null is fine). */
void QLIBPluginExit(QLIBPLUGIN* handle);

#ifdef __cplusplus
}
#endif

#endif
