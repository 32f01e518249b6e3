# SPDX-License-Identifier: Apache-2.0
# find_package(OrvaneModule REQUIRED) gives orvane_add_module() and the target OrvaneModule::contract.
include(${CMAKE_CURRENT_LIST_DIR}/OrvaneModuleTargets.cmake)
include(${CMAKE_CURRENT_LIST_DIR}/OrvaneModule.cmake)
