#include "cmpi/Status_Map.h"

#include <gtest/gtest.h>

#include <map>
#include <string>

#include "runtime/Provider_Operations.h"

namespace cimrt {
namespace {

struct Row {
  Status_Family family;
  std::int32_t status;
  CMPIrc code;
};

using F = Status_Family;

const Row rows[] = {
    {F::GET_INSTANCE, 60, CMPI_RC_ERR_NOT_FOUND},
    {F::GET_INSTANCE, 61, CMPI_RC_ERR_FAILED},
    {F::GET_INSTANCE, 62, CMPI_RC_ERR_INVALID_PARAMETER},
    {F::GET_INSTANCE, 63, CMPI_RC_ERR_ACCESS_DENIED},
    {F::GET_INSTANCE, 64, CMPI_RC_ERR_FAILED},
    {F::ENUM_INSTANCES, 70, CMPI_RC_ERR_FAILED},
    {F::ENUM_INSTANCES, 71, CMPI_RC_ERR_ACCESS_DENIED},
    {F::CREATE_INSTANCE, 80, CMPI_RC_ERR_ALREADY_EXISTS},
    {F::CREATE_INSTANCE, 81, CMPI_RC_ERR_NOT_SUPPORTED},
    {F::CREATE_INSTANCE, 82, CMPI_RC_ERR_INVALID_PARAMETER},
    {F::CREATE_INSTANCE, 83, CMPI_RC_ERR_ACCESS_DENIED},
    {F::CREATE_INSTANCE, 84, CMPI_RC_ERR_FAILED},
    {F::DELETE_INSTANCE, 90, CMPI_RC_ERR_NOT_FOUND},
    {F::DELETE_INSTANCE, 91, CMPI_RC_ERR_NOT_SUPPORTED},
    {F::DELETE_INSTANCE, 92, CMPI_RC_ERR_ACCESS_DENIED},
    {F::DELETE_INSTANCE, 93, CMPI_RC_ERR_FAILED},
    {F::MODIFY_INSTANCE, 100, CMPI_RC_ERR_NOT_FOUND},
    {F::MODIFY_INSTANCE, 101, CMPI_RC_ERR_NOT_SUPPORTED},
    {F::MODIFY_INSTANCE, 102, CMPI_RC_ERR_INVALID_PARAMETER},
    {F::MODIFY_INSTANCE, 103, CMPI_RC_ERR_ACCESS_DENIED},
    {F::MODIFY_INSTANCE, 104, CMPI_RC_ERR_FAILED},
    {F::ENUM_ASSOCIATOR_NAMES, 110, CMPI_RC_ERR_FAILED},
    {F::ENUM_ASSOCIATOR_NAMES, 111, CMPI_RC_ERR_NOT_SUPPORTED},
    {F::ENUM_ASSOCIATOR_NAMES, 112, CMPI_RC_ERR_ACCESS_DENIED},
    {F::ENUM_REFERENCES, 120, CMPI_RC_ERR_FAILED},
    {F::ENUM_REFERENCES, 121, CMPI_RC_ERR_NOT_SUPPORTED},
    {F::ENUM_REFERENCES, 122, CMPI_RC_ERR_ACCESS_DENIED},
    {F::INVOKE_METHOD, 130, CMPI_RC_ERR_FAILED},
    {F::INVOKE_METHOD, 131, CMPI_RC_ERR_NOT_SUPPORTED},
    {F::INVOKE_METHOD, 132, CMPI_RC_ERR_ACCESS_DENIED},
    {F::ENABLE_INDICATIONS, 140, CMPI_RC_ERR_FAILED},
    {F::DISABLE_INDICATIONS, 150, CMPI_RC_ERR_FAILED},
    {F::ENUM_ASSOCIATORS, 170, CMPI_RC_ERR_FAILED},
    {F::ENUM_ASSOCIATORS, 172, CMPI_RC_ERR_ACCESS_DENIED},
};

TEST(StatusMap, EveryFailureOfAFamilyHasItsCode) {
  for (const Row& row : rows)
    EXPECT_EQ(code_of_status(row.family, row.status), row.code) << row.status;
}

TEST(StatusMap, SuccessAndUnlistedNumbersAreSuccess) {
  for (const Row& row : rows) {
    for (const std::int32_t status : {0, -1, 1, 30, 999})
      EXPECT_EQ(code_of_status(row.family, status), CMPI_RC_OK) << status;
    EXPECT_EQ(code_of_status(row.family, static_cast<std::int32_t>(row.family) + 9), CMPI_RC_OK);
  }
  EXPECT_EQ(code_of_status(F::ENUM_ASSOCIATORS, ENUM_ASSOCIATORS_UNSUPPORTED), CMPI_RC_OK);
}

TEST(StatusMap, StatusesOfOtherFamiliesAreSuccess) {
  for (const Row& row : rows)
    for (const Row& other : rows) {
      if (row.family == other.family) continue;
      EXPECT_EQ(code_of_status(row.family, other.status), CMPI_RC_OK);
    }
}

TEST(StatusMap, CodesHaveTheirNames) {
  const std::map<int, std::string> names = {{0, "CMPI_RC_OK"},
                                            {1, "CMPI_RC_ERR_FAILED"},
                                            {2, "CMPI_RC_ERR_ACCESS_DENIED"},
                                            {3, "CMPI_RC_ERR_INVALID_NAMESPACE"},
                                            {4, "CMPI_RC_ERR_INVALID_PARAMETER"},
                                            {5, "CMPI_RC_ERR_INVALID_CLASS"},
                                            {6, "CMPI_RC_ERR_NOT_FOUND"},
                                            {7, "CMPI_RC_ERR_NOT_SUPPORTED"},
                                            {8, "CMPI_RC_ERR_CLASS_HAS_CHILDREN"},
                                            {9, "CMPI_RC_ERR_CLASS_HAS_INSTANCES"},
                                            {10, "CMPI_RC_ERR_INVALID_SUPERCLASS"},
                                            {11, "CMPI_RC_ERR_ALREADY_EXISTS"},
                                            {12, "CMPI_RC_ERR_NO_SUCH_PROPERTY"},
                                            {13, "CMPI_RC_ERR_TYPE_MISMATCH"},
                                            {14, "CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED"},
                                            {15, "CMPI_RC_ERR_INVALID_QUERY"},
                                            {16, "CMPI_RC_ERR_METHOD_NOT_AVAILABLE"},
                                            {17, "CMPI_RC_ERR_METHOD_NOT_FOUND"},
                                            {50, "CMPI_RC_DO_NOT_UNLOAD"},
                                            {51, "CMPI_RC_NEVER_UNLOAD"},
                                            {60, "CMPI_RC_ERR_INVALID_HANDLE"},
                                            {61, "CMPI_RC_ERR_INVALID_DATA_TYPE"},
                                            {100, "CMPI_RC_ERROR_SYSTEM"},
                                            {200, "CMPI_RC_ERROR"}};
  for (int code = 0; code <= 200; ++code) {
    const auto named = names.find(code);
    const std::string expected = named == names.end() ? "CMPI_RC_ERR_FAILED" : named->second;
    EXPECT_EQ(name_of_code(static_cast<CMPIrc>(code)), expected) << code;
  }
}

}  // namespace
}  // namespace cimrt
