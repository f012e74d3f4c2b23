/* Searches the people of some pictures for the one of another:
 * search <orbek.conf> <probe.jpg> <person.jpg>... */

#include <orbek/corbek.h>

#include <stdio.h>
#include <stdlib.h>

/* A file or a record; data is null if there is none. */
struct bytes {
    unsigned char* data;
    unsigned int size;
};

static struct bytes read_file(const char* name) {
    struct bytes bytes = {NULL, 0};
    FILE* file = fopen(name, "rb");
    long size;
    if (!file) return bytes;
    if (fseek(file, 0, SEEK_END) == 0 && (size = ftell(file)) > 0 && fseek(file, 0, SEEK_SET) == 0) {
        bytes.data = malloc((size_t)size);
        if (bytes.data) bytes.size = (unsigned int)fread(bytes.data, 1, (size_t)size, file);
    }
    fclose(file);
    return bytes;
}

/* The record of the person in a picture. */
static struct bytes enrol(const char* picture) {
    struct bytes fir = {NULL, 0}, jpeg = read_file(picture);
    const char* data = (const char*)jpeg.data;
    float x0, y0, x1, y1;
    if (jpeg.data && orbekFindEyes(data, jpeg.size, &x0, &y0, &x1, &y1) == 0) {
        /* The first call tells how large the record is. */
        if (orbekGenerateFIR(data, jpeg.size, x0, y0, x1, y1, NULL, 0, &fir.size) == 3)
            fir.data = malloc(fir.size);
        if (fir.data &&
            orbekGenerateFIR(data, jpeg.size, x0, y0, x1, y1, fir.data, (int)fir.size, &fir.size)) {
            free(fir.data);
            fir.data = NULL;
        }
    }
    if (!fir.data) fprintf(stderr, "search: no face can be enrolled from %s\n", picture);
    free(jpeg.data);
    return fir;
}

int main(int argc, char** argv) {
    struct bytes probe, person;
    orbekMatch matches[3];
    unsigned int count = 0, i;
    void* people;
    int k, status = 1;
    if (argc < 4) {
        fprintf(stderr, "usage: search <orbek.conf> <probe.jpg> <person.jpg>...\n");
        return 2;
    }
    if (orbekInit(argv[1]) != 0 || !(people = orbekCreatePopulation())) return 1;
    probe = enrol(argv[2]);
    for (k = 3; k < argc; ++k) {
        float score;
        person = enrol(argv[k]);
        if (person.data && probe.data &&
            orbekCompare(probe.data, probe.size, person.data, person.size, &score) == 0)
            printf("%s is compared: %.3f\n", argv[k], score);
        if (person.data) orbekAppendToPopulation(people, person.data, person.size, argv[k]);
        free(person.data);
    }

    /* The three most likely, if their score is half at least. */
    if (probe.data && orbekBestMatches(probe.data, probe.size, people, 0.5f, 3, matches, &count) == 0) {
        printf("%u of them may be the person of %s\n", count, argv[2]);
        for (i = 0; i < count; ++i) printf("%s is found: %.3f\n", matches[i].id, matches[i].score);
        status = 0;
    }
    free(probe.data);
    orbekDeletePopulation(people);
    return status;
}
