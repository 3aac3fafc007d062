#include "service/service_operations.h"

namespace lumeris {

namespace {

ServiceOperations BuildInstalledOperations() {
  ServiceOperations operations;
  return operations;
}

}  // namespace

const ServiceOperations& InstalledServiceOperations() {
  static const ServiceOperations operations = BuildInstalledOperations();
  return operations;
}

}  // namespace lumeris
