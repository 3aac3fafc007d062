#include "service/service_operations.h"

#include "categories/category_catalogue.h"
#include "database/database_operations.h"
#include "service/large_viewer.h"
#include "store/store_operations.h"

namespace lumeris {

namespace {

ServiceOperations BuildInstalledOperations() {
  ServiceOperations operations;
  InstallStoreOperations(operations);
  InstallDatabaseOperations(operations);
  operations.PrepareOpeningLargeVistrel = PrepareOpeningLargeVistrel;
  operations.CreateXPCCategoryDataArray = CreateXPCCategoryDataArray;
  return operations;
}

}  // namespace

const ServiceOperations& InstalledServiceOperations() {
  static const ServiceOperations operations = BuildInstalledOperations();
  return operations;
}

}  // namespace lumeris
