// SPDX-License-Identifier: MIT
#pragma once

/// \file
/// The whole public interface.

#include <orb/export.h>
#include <orb/fileinfo/drive_type.h>
#include <orb/fileinfo/file_handle.h>
#include <orb/fileops/access.h>
#include <orb/fileops/copy.h>
#include <orb/fileops/create.h>
#include <orb/fileops/move.h>
#include <orb/fileops/path_relations.h>
#include <orb/fileops/progress.h>
#include <orb/fileops/remove.h>
#include <orb/fileops/rename.h>
#include <orb/fileops/temp_files.h>
#include <orb/fileops/trash.h>
#include <orb/fileops/whole_file.h>
#include <orb/path/file_path.h>
#include <orb/path/file_type.h>
#include <orb/path/path_text.h>
#include <orb/platform/core_foundation.h>
#include <orb/records/geometry.h>
#include <orb/records/geotag.h>
#include <orb/records/image_property.h>
#include <orb/records/metadata.h>
#include <orb/records/output.h>
#include <orb/records/upload.h>
#include <orb/records/workspace.h>
#include <orb/result.h>
#include <orb/strings/char_types.h>
#include <orb/strings/string_data.h>
#include <orb/strings/string_functions.h>
#include <orb/thread/critical_section.h>
#include <orb/thread/event.h>
#include <orb/thread/thread.h>
#include <orb/time/time.h>
