# Sourced by the scripts in the root and by .ci/run: which Debian packages each job needs, and how they come.

# Building, running and testing.
build_packages="build-essential g++ cmake ninja-build ccache pkg-config git
libopencv-core-dev libopencv-imgproc-dev libopencv-imgcodecs-dev libcfitsio-dev libcli11-dev libsleef-dev
libgtest-dev libbenchmark-dev
pybind11-dev python3-dev python3 python3-numpy python3-scipy python3-skimage python3-pytest
python3-dask python3-distributed"

# Formatting and fuzzing, for those who change the project.
dev_packages="clang clang-format libclang-rt-14-dev"

# The site of the documentation.
docs_packages="mkdocs mkdocs-material"

# Making Debian packages and looking for faults in them.
package_packages="dpkg-dev file lintian"

# Installs those of the named packages that are missing; says nothing and touches nothing if none is.
need_packages() {
    missing=
    for package in "$@"; do
        status=$(dpkg-query -W -f '${db:Status-Status}' "$package" 2>/dev/null) || status=
        [ "$status" = installed ] || missing="$missing $package"
    done
    [ -n "$missing" ] || return 0

    if ! command -v apt-get >/dev/null; then
        echo "These Debian packages are needed, and there is no apt-get here:$missing" >&2
        return 1
    fi
    as_root=
    if [ "$(id -u)" -ne 0 ]; then
        command -v sudo >/dev/null || { echo "Run this as root (no sudo here) to install:$missing" >&2; return 1; }
        as_root=sudo
    fi
    echo "Installing:$missing"
    set -- -qq -o Acquire::Retries=3 -o DPkg::Lock::Timeout=300 -o Dpkg::Use-Pty=0
    $as_root apt-get "$@" update </dev/null >&2 || return 1
    $as_root env DEBIAN_FRONTEND=noninteractive \
        apt-get "$@" -y --no-install-recommends install $missing </dev/null >/dev/null
}

# Parallel compile jobs: the processors there are, but no more than the memory carries (about 1.5 GB each).
job_count() {
    processors=$(nproc)
    memory=$(awk '/MemAvailable/ {print int($2 / 1500000)}' /proc/meminfo)
    [ "$memory" -ge "$processors" ] || processors=$memory
    [ "$processors" -ge 1 ] || processors=1
    echo "$processors"
}

# configure PRESET [OPTION...]: quiet when all is well.
configure() {
    log=$(mktemp)
    if cmake --preset "$@" >"$log" 2>&1; then
        rm -f "$log"
    else
        cat "$log" >&2
        rm -f "$log"
        return 1
    fi
}
