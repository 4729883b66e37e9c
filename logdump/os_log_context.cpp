#include "logdump/os_log_context.h"

const LogContext& GetOsLogContext() {
  static const LogContext context{"org.velltool", "global"};
  return context;
}
