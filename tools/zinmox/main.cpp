// zinmox: the command-line tool of libZinMOX.
#include "Commands.h"
#include "Dispatch.h"
#include "Session.h"

int main(int argc, char** argv) {
  int status = 0;
  {
    zinmox::Session session;
    const std::unique_ptr<CLI::App> app = zinmox::buildApp(session, false);
    status = zinmox::execute(*app, [&] { app->parse(argc, argv); });
  }
  return status;
}
