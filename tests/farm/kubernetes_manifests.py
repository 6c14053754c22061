#!/usr/bin/python3
"""Checks the farm's Kubernetes manifests against the API's own models, offline: the Python
client's classes are generated from the API's OpenAPI schema, so every field a manifest writes
must be one they know, of the kind they declare, with every field they require. Then checks
what the farm needs of them: an Indexed Job of the chunks and a Job of the assembly running the
same image and entry point, which reads the index Kubernetes gives.

    kubernetes_manifests.py EXAMPLES_FARM_FOLDER
"""
import os
import re
import subprocess
import sys

import yaml
from kubernetes import client

PRIMITIVES = {"str": str, "int": int, "bool": bool, "float": (int, float), "object": object}
problems = []


def check(value, kind, path):
    """Walks the value as the model type `kind` describes it, collecting every mismatch."""
    inner = re.fullmatch(r"list\[(.+)\]", kind)
    if inner:
        if not isinstance(value, list):
            return problems.append(f"{path}: expected a list")
        for i, item in enumerate(value):
            check(item, inner.group(1), f"{path}[{i}]")
        return
    inner = re.fullmatch(r"dict\(str, (.+)\)", kind)
    if inner:
        if not isinstance(value, dict):
            return problems.append(f"{path}: expected a map")
        for key, item in value.items():
            check(item, inner.group(1), f"{path}.{key}")
        return
    if kind in PRIMITIVES:
        if not isinstance(value, PRIMITIVES[kind]) or (kind == "int" and isinstance(value, bool)):
            problems.append(f"{path}: expected {kind}, got {value!r}")
        return
    model = getattr(client.models, kind)
    if not isinstance(value, dict):
        return problems.append(f"{path}: expected a {kind} object")
    fields = {json: name for name, json in model.attribute_map.items()}
    for key, item in value.items():
        if key not in fields:
            problems.append(f"{path}.{key}: not a field of {kind}")
        else:
            check(item, model.openapi_types[fields[key]], f"{path}.{key}")


def main(folder):
    jobs = {}
    for name in ("kubernetes-job.yaml", "kubernetes-assemble.yaml"):
        with open(os.path.join(folder, name), encoding="utf-8") as stream:
            document = yaml.safe_load(stream)
        check(document, "V1Job", name)
        try:  # the models' constructors refuse a missing required field
            client.ApiClient()._ApiClient__deserialize(document, "V1Job")
        except (ValueError, TypeError) as error:
            problems.append(f"{name}: {error}")
        jobs[name] = document
    chunks, assembly = jobs["kubernetes-job.yaml"], jobs["kubernetes-assemble.yaml"]
    spec = chunks["spec"]
    if spec.get("completionMode") != "Indexed" or spec.get("completions", 0) < 1:
        problems.append("kubernetes-job.yaml: expected an Indexed Job with completions")
    containers = [job["spec"]["template"]["spec"]["containers"][0] for job in (chunks, assembly)]
    if containers[0]["image"] != containers[1]["image"]:
        problems.append("the chunks and the assembly run different images")
    commands = [container["command"] for container in containers]
    if [c[1] for c in commands] != ["chunk", "assemble"] or commands[0][0] != commands[1][0]:
        problems.append(f"expected one entry point, for chunk and assemble: {commands}")
    # The entry point renders the chunk whose index Kubernetes gives.
    environment = dict(os.environ, VELTRANE="echo", JOB_COMPLETION_INDEX="5")
    ran = subprocess.run([os.path.join(folder, "entrypoint.sh"), "chunk", commands[0][2]],
                         env=environment, capture_output=True, text=True, check=False)
    expected = f"render --plan {commands[0][2]} --chunk 5 --quiet"
    if ran.stdout.strip() != expected:
        problems.append(f"entrypoint.sh: expected '{expected}', got '{ran.stdout.strip()}'")
    for problem in problems:
        print(problem, file=sys.stderr)
    print(f"{len(jobs)} manifests: {'ok' if not problems else f'{len(problems)} problems'}")
    return 1 if problems else 0


if __name__ == "__main__":
    sys.exit(main(sys.argv[1]))
