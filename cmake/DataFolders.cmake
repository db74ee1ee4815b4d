# Where tests and benchmarks find their data, in one place: the golden
# inputs and charts, the bundled samples, and the measured evaluation data set
# in the shared folder beside the project (read from there when it is there,
# never copied into the project).
add_library(VeltmarquistDataFolders INTERFACE)
target_compile_definitions(VeltmarquistDataFolders INTERFACE
  VELTMARQUIST_GOLDEN_DIR="${PROJECT_SOURCE_DIR}/tests/golden"
  VELTMARQUIST_SAMPLES_DIR="${PROJECT_SOURCE_DIR}/samples"
  VELTMARQUIST_SHARED_DATA_DIR="${PROJECT_SOURCE_DIR}/../shared/data")
