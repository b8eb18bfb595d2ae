#pragma once

struct clap_host;
class QString;

/// What the plug-ins of a module are handed as their host: a name, log and thread check. It is made on the
/// thread that asks them, which is their main thread.
///
/// It lives as long as the process: a plug-in may call it from a thread that nobody stopped, or after it was
/// destroyed. `path` is what its messages are logged with.
const clap_host &newClapHost(const QString &path);
