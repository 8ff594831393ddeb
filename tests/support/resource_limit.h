// SPDX-License-Identifier: MIT
#pragma once

#include <sys/resource.h>

namespace orb::test {

/// While it lives, this process gets no more of a resource: RLIMIT_AS, RLIMIT_NOFILE, ...
class ResourceLimit {
 public:
  ResourceLimit(__rlimit_resource_t resource, rlim_t most) : resource_(resource) {
    ::getrlimit(resource, &before_);
    const rlimit scarce = {most, before_.rlim_max};
    ::setrlimit(resource, &scarce);
  }
  ~ResourceLimit() { ::setrlimit(resource_, &before_); }
  ResourceLimit(const ResourceLimit&) = delete;
  ResourceLimit& operator=(const ResourceLimit&) = delete;

 private:
  __rlimit_resource_t resource_;
  rlimit before_ = {};
};

}  // namespace orb::test
