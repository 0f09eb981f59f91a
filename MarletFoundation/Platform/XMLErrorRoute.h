#pragma once

#include <libxml/xmlerror.h>

namespace MarletFoundation {

/// Sends what libxml2 reports on this thread to a handler, for a while, and nothing of it to standard error.
class XMLErrorRoute {
 public:
  XMLErrorRoute(void* receiver, xmlStructuredErrorFunc handler)
      : formerReceiver_(xmlStructuredErrorContext),
        formerHandler_(xmlStructuredError),
        formerPrinterReceiver_(xmlGenericErrorContext),
        formerPrinter_(xmlGenericError) {
    xmlSetStructuredErrorFunc(receiver, handler);
    xmlSetGenericErrorFunc(nullptr, drop);
  }
  ~XMLErrorRoute() {
    xmlSetGenericErrorFunc(formerPrinterReceiver_, formerPrinter_);
    xmlSetStructuredErrorFunc(formerReceiver_, formerHandler_);
  }
  XMLErrorRoute(const XMLErrorRoute&) = delete;
  XMLErrorRoute& operator=(const XMLErrorRoute&) = delete;

 private:
  /// What takes the few complaints that are printed without being reported.
  static void drop(void*, const char*, ...) {}

  void* formerReceiver_;
  xmlStructuredErrorFunc formerHandler_;
  void* formerPrinterReceiver_;
  xmlGenericErrorFunc formerPrinter_;
};

}  // namespace MarletFoundation
