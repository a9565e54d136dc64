#ifndef VORN_PLATFORM_PLUGIN_TIMEOUT_H
#define VORN_PLATFORM_PLUGIN_TIMEOUT_H

namespace vorn {
namespace platform {

// Shortens the bound on one plug-in script (QLIB_PLUGIN_TIMEOUT_SECONDS) so that a test of a
// hanging script need not wait for it; a value of 0 or less restores the real bound. Not for
// production code: integrators rely on the documented 10 s.
void SetPluginTimeoutForTests(int milliseconds);

}  // namespace platform
}  // namespace vorn

#endif
