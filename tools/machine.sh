# shellcheck shell=bash disable=SC2034
# Shared by ./run and ./test: where the tree is, and installing what is missing.
# Sourced by bash scripts.
set -euo pipefail

root=$(CDPATH='' cd -- "$(dirname -- "${BASH_SOURCE[0]}")/.." && pwd)
jobs=$(nproc)

# The packages of the given stages of tools/packages.
packages_of() {
    local stage
    for stage in "$@"; do
        awk -v stage="$stage" '$1 == stage { print $2 }' "$root/tools/packages"
    done
}

is_installed() {
    [ "$(dpkg-query -W -f '${db:Status-Status}' "$1" 2>/dev/null)" = installed ]
}

as_root() {
    if [ "$(id -u)" -eq 0 ]; then
        "$@"
    else
        sudo "$@"
    fi
}

apt_get() {
    as_root env DEBIAN_FRONTEND=noninteractive apt-get -q -y -o DPkg::Lock::Timeout=300 "$@" </dev/null
}

# The repository that the machine's own Debian packages come from, without its updates.
debian_mirror() {
    local codename mirror
    codename=$(. /etc/os-release && echo "$VERSION_CODENAME")
    # shellcheck disable=SC2016 # expanded by apt
    mirror=$(apt-get indextargets --format '$(CREATED_BY) $(RELEASE) $(COMPONENT) $(REPO_URI)' |
        awk -v release="$codename" '$1 == "Packages" && $2 == release && $3 == "main" { print $4; exit }')
    if [ -z "$mirror" ]; then
        echo "apt has no Debian repository configured, see sources.list(5)" >&2
        return 1
    fi
    echo "$mirror"
}

# Installs what is missing of the given stages; touches neither apt nor the network when nothing is.
install_packages() {
    local package missing=()
    for package in $(packages_of "$@"); do
        is_installed "$package" || missing+=("$package")
    done
    if [ ${#missing[@]} -eq 0 ]; then
        return
    fi
    echo "== install ${missing[*]}"
    if ! { apt_get update && apt_get install --no-install-recommends "${missing[@]}"; }; then
        echo "These Debian packages are missing and could not be installed: ${missing[*]}" >&2
        return 1
    fi
}
