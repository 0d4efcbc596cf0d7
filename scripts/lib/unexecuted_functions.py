"""Lists the functions that were never executed, each instantiation of a template by itself: gcov's lines do not tell
which source layouts were written in which output formats. Argument: a folder with the counters of a build. What does not
lie below the current folder, in the libraries, is left out."""
import json
import os
import re
import subprocess
import sys

LIBRARIES = re.compile(r'(frame|bmp|wbmp|png|gif|host)/(?!testing/)')


def counter_files(build):
    for folder, _, names in os.walk(build):
        yield from (os.path.join(folder, name) for name in names if name.endswith('.gcno'))


def functions_of(counters):
    """Pairs of ((file, name), count); a file per call of gcov, which writes one line of JSON each."""
    said = subprocess.run(['gcov', '--json-format', '--stdout', counters], capture_output=True, text=True, check=True)
    for line in filter(None, said.stdout.splitlines()):
        report = json.loads(line)
        for source in report['files']:
            name = os.path.relpath(os.path.join(report['current_working_directory'], source['file']))
            if LIBRARIES.match(name):
                for function in source['functions']:
                    yield (name, function['demangled_name']), function['execution_count']


def main():
    counts = {}
    for counters in sorted(counter_files(sys.argv[1])):
        for function, count in functions_of(counters):
            counts[function] = counts.get(function, 0) + count
    never = sorted(function for function, count in counts.items() if count == 0)
    for name, function in never:
        print(f'{name}: {function}')
    print(f'{len(never)} of {len(counts)} functions were not executed')


if __name__ == '__main__':
    main()
